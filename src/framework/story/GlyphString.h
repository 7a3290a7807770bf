#pragma once

#include "framework/kernel/StringT.h"
#include "framework/story/Glyph.h"

#include <string>
#include <string_view>
#include <vector>

namespace Story
{

/// A piece of text without attributes: characters and special elements, on its way into or out of a story.
class GlyphString
{
public:
    struct Object
    {
        std::size_t m_Offset = 0;
        Kernel::Counted<Glyph const> m_Glyph;
    };

    /// Appends a character; a value that is no Unicode scalar becomes U+FFFD. U+FFFC, which stands for elements, does
    /// too.
    void AddChar32(unsigned int character);
    /// Appends UTF-8; ill-formed bytes become U+FFFD, one for each maximal ill-formed part.
    void AddText(std::string_view utf8);
    void AddGlyph(Kernel::Counted<Glyph const> glyph);

    [[nodiscard]] bool Empty() const { return m_Text.empty(); }
    /// UTF-16, with U+FFFC at each element.
    [[nodiscard]] std::u16string const & GetText() const { return m_Text; }
    [[nodiscard]] std::vector<Object> const & GetObjects() const { return m_Objects; }
    /// The characters in UTF-8, elements left out.
    [[nodiscard]] String ToString() const;

private:
    std::u16string m_Text;
    std::vector<Object> m_Objects;
};

}
