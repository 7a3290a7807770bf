#include "import/ChapterText.h"

#include "import/SourceText.h"

#include <algorithm>

namespace Import
{

bool Attributes::HasClass(std::string_view name) const
{
    return std::find(m_Classes.begin(), m_Classes.end(), name) != m_Classes.end();
}

std::string const * Attributes::Find(std::string_view key) const
{
    for (auto const & [name, value] : m_Values) {
        if (name == key) {
            return &value;
        }
    }
    return nullptr;
}

std::string ChapterText::Title() const
{
    if (!m_FrontMatter.m_Title.empty()) {
        return m_FrontMatter.m_Title;
    }
    for (Block const & block : m_Blocks) {
        if (BlockKind::Heading != block.m_Kind) {
            continue;
        }
        std::u16string text;
        for (char16_t const c : block.m_Text.m_Text) {
            if (u'\uFFFC' != c) {
                text += u'\u2028' == c ? u' ' : c;
            }
        }
        return ToUtf8(text);
    }
    return {};
}

}
