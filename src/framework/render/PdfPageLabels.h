#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace Renderer::RenderTree
{

/// A stretch of pages whose labels count on (ISO 32000-2, 12.4.2).
struct PdfLabelRange
{
    enum class Style
    {
        /// The prefix alone.
        None,
        Decimal,
        RomanLower,
        RomanUpper,
    };

    /// Page from 0.
    std::size_t m_FirstPage = 0;
    Style m_Style = Style::None;
    std::string m_Prefix;
    /// Of the first page, 1 or more; without a style it means nothing.
    int m_Start = 1;

    friend bool operator==(PdfLabelRange const &, PdfLabelRange const &) = default;
};

/// The fewest ranges, found from the front, that give these labels exactly: the same text for each page.
[[nodiscard]] std::vector<PdfLabelRange> CompressPageLabels(std::vector<std::string_view> const & labels);

/// The label that a reader makes for the page that is `offset` pages into the range.
[[nodiscard]] std::string LabelOf(PdfLabelRange const & range, std::size_t offset);

/// A number from 1 to 3999 in lower-case Roman numerals.
[[nodiscard]] std::string ToRoman(int number);

}
