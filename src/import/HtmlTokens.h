#pragma once

#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace Import
{

/// One piece of raw HTML as it stands inside Markdown.
struct HtmlToken
{
    enum class Kind
    {
        Text,
        OpenTag,
        CloseTag,
        Comment
    };

    Kind m_Kind = Kind::Text;
    /// Lower-cased name of a tag.
    std::string m_Name;
    /// Text with its character references decoded, or the comment's content.
    std::string m_Text;
    /// Names lower-cased, values decoded.
    std::vector<std::pair<std::string, std::string>> m_Attributes;
    bool m_IsSelfClosing = false;
    /// Lines from the start of the HTML to the token.
    int m_LineOffset = 0;

    /// Value of an attribute, empty if there is none.
    [[nodiscard]] std::string const & Value(std::string_view name) const;
};

/// Splits HTML into tokens. Whatever does not form a tag is text: no input is refused and nothing gets lost.
std::vector<HtmlToken> TokeniseHtml(std::string_view html);

/// Decodes "&amp;", "&#233;" and the named characters that prose uses; others stay as written.
std::string DecodeCharacterReferences(std::string_view text);

}
