#include "framework/story/GlyphString.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/Utf.h"

#include <algorithm>

namespace Story
{

namespace
{

constexpr char16_t Replacement = u'\uFFFD';

}

void GlyphString::AddChar32(unsigned int character)
{
    bool const isScalar = character <= 0x10FFFF && (character < 0xD800 || character > 0xDFFF);
    Kernel::AppendUtf16(m_Text, isScalar && character != ObjectCharacter ? static_cast<char32_t>(character)
                                                                         : static_cast<char32_t>(Replacement));
}

void GlyphString::AddText(std::string_view utf8)
{
    auto const begin = static_cast<std::ptrdiff_t>(m_Text.size());
    Kernel::AppendUtf16(m_Text, utf8);
    std::replace(m_Text.begin() + begin, m_Text.end(), ObjectCharacter, Replacement);
}

void GlyphString::AddGlyph(Kernel::Counted<Glyph const> glyph)
{
    KORVANE_ASSERT(glyph);
    m_Objects.push_back({m_Text.size(), std::move(glyph)});
    m_Text.push_back(ObjectCharacter);
}

String GlyphString::ToString() const
{
    std::u16string text;
    std::remove_copy(m_Text.begin(), m_Text.end(), std::back_inserter(text), ObjectCharacter);
    return Kernel::Utf16ToUtf8(text);
}

}
