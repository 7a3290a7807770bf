#pragma once

#include "framework/typeset/LineArena.h"
#include "framework/typeset/ParagraphBuilder.h"

#include <string>
#include <string_view>
#include <vector>

[[nodiscard]] std::string ToUtf8(std::u16string_view text);
[[nodiscard]] std::u16string ToUtf16(std::string_view text);

/// Paragraphs (lines of Markdown that are not empty) of a folder of the corpus, which KORVANE_CORPUS names, or which lies beside
/// the checkout; none where it is not there.
[[nodiscard]] std::vector<std::u16string> ReadCorpus(std::string const & folder);

/// A paragraph of one style, set and looked at.
class SetParagraph
{
public:
    SetParagraph();

    /// In the style and settings below.
    SetParagraph & Set(std::u16string text);

    /// Each line's text, a hyphen that was added shown as "-".
    [[nodiscard]] std::vector<std::string> Lines() const;
    /// Text clusters of a line in visual order, as the source offsets of its glyphs.
    [[nodiscard]] std::vector<std::uint32_t> Clusters(std::size_t line) const;

    Typeset::TextStyle m_Style;
    Typeset::ParagraphSettings m_Settings;
    std::vector<Typeset::InlineObject> m_Objects;
    std::u16string m_Text;
    Typeset::LineArena m_Arena;
    Typeset::ParagraphLines m_Lines;
};

/// Says what is wrong with a composed paragraph: text not covered or covered twice, runs beyond their arrays, clusters
/// outside their runs, widths that do not add up. Empty if nothing is.
[[nodiscard]] std::string FindFault(Typeset::LineArena const & arena, Typeset::ParagraphLines const & lines,
                                    std::size_t textLength);

/// Everything in an arena as text, to compare two.
[[nodiscard]] std::string Describe(Typeset::LineArena const & arena);
