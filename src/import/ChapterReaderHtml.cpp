#include "import/AttributeReader.h"
#include "import/ChapterReader.h"
#include "import/HtmlTokens.h"
#include "import/SourceText.h"
#include "import/Text.h"

#include <algorithm>

namespace Import
{

namespace
{

struct TagMark
{
    std::string_view m_Name;
    Mark m_Mark;
};

/// Tags that only change the look of their text.
constexpr std::array g_TagMarks{
    TagMark{"em", Mark::Emphasis},   TagMark{"i", Mark::Emphasis},      TagMark{"cite", Mark::Emphasis},
    TagMark{"var", Mark::Emphasis},  TagMark{"dfn", Mark::Emphasis},    TagMark{"strong", Mark::Strong},
    TagMark{"b", Mark::Strong},      TagMark{"u", Mark::Underline},     TagMark{"ins", Mark::Underline},
    TagMark{"s", Mark::Strike},      TagMark{"strike", Mark::Strike},   TagMark{"del", Mark::Strike},
    TagMark{"sub", Mark::Subscript}, TagMark{"sup", Mark::Superscript}, TagMark{"code", Mark::Code},
    TagMark{"tt", Mark::Code},       TagMark{"samp", Mark::Code},       TagMark{"kbd", Mark::Keyboard},
    TagMark{"small", Mark::Small},   TagMark{"mark", Mark::Highlight},
};

/// Tags that part paragraphs and mean nothing more in print.
constexpr std::array<std::string_view, 15> g_ParagraphTags{"p",      "div",     "section", "article",    "aside",
                                                           "header", "footer",  "main",    "nav",        "center",
                                                           "figure", "details", "address", "blockquote", "picture"};

/// Tags whose structure is lost when their text is set as paragraphs.
constexpr std::array<std::string_view, 11> g_StructureTags{"ul",    "ol", "li", "dl", "dt",     "dd",
                                                           "table", "tr", "td", "th", "caption"};

template <typename TList>
bool Contains(TList const & list, std::string_view name)
{
    return std::find(list.begin(), list.end(), name) != list.end();
}

Mark MarkOfTag(std::string_view name)
{
    auto const found =
        std::find_if(g_TagMarks.begin(), g_TagMarks.end(), [name](TagMark const & t) { return t.m_Name == name; });
    return found == g_TagMarks.end() ? Mark::None : found->m_Mark;
}

bool HasWord(std::string_view words, std::string_view word)
{
    for (std::size_t at = words.find(word); std::string_view::npos != at; at = words.find(word, at + 1)) {
        bool const starts = 0 == at || ' ' == words[at - 1];
        bool const ends = at + word.size() == words.size() || ' ' == words[at + word.size()];
        if (starts && ends) {
            return true;
        }
    }
    return false;
}

}

void ChapterReader::ReadInlineHtml(std::string_view html, int line)
{
    for (HtmlToken const & token : TokeniseHtml(html)) {
        if (HtmlToken::Kind::Text == token.m_Kind) {
            AppendText(token.m_Text, false);
        } else if (HtmlToken::Kind::Comment != token.m_Kind) {
            ReadTag(token, line + token.m_LineOffset);
        }
    }
}

void ChapterReader::ReadTag(HtmlToken const & token, int line)
{
    bool const isClosing = HtmlToken::Kind::CloseTag == token.m_Kind;
    if (isClosing) {
        CloseTag(token.m_Name);
        return;
    }
    std::string const & id = token.Value("id").empty() && "a" == token.m_Name ? token.Value("name") : token.Value("id");
    if (!id.empty()) {
        AddAnchorAt(Builder().Position(), id, line);
    }
    if ("br" == token.m_Name) {
        Builder().Append(u'\u2028');
    } else if ("wbr" == token.m_Name) {
        Builder().Append(u'\u200B');
    } else if ("img" == token.m_Name) {
        ReadImageTag(token, line);
    } else if (token.m_IsSelfClosing) {
        if ("a" != token.m_Name && "span" != token.m_Name) {
            Warn("html-unknown", line,
                 Text("The tag <%1/> has no meaning in print and is left out.", "Source", token.m_Name));
        }
    } else {
        OpenTag tag{token.m_Name, MarkOfTag(token.m_Name), Builder().GetLink(), line, false};
        std::string const & classes = token.Value("class");
        bool const isLink = "a" == token.m_Name && !token.Value("href").empty();
        if (isLink) {
            m_Chapter.m_Links.push_back({token.Value("href"), line + m_LineOffset, false});
            Builder().SetLink(static_cast<std::int32_t>(m_Chapter.m_Links.size() - 1));
            tag.m_IsLink = true;
        } else if ("q" == token.m_Name) {
            Builder().Append(u'"');
        } else if ("span" == token.m_Name) {
            bool const startsBlock = Builder().Text().find_first_not_of(u" \n") == std::u16string::npos;
            if (startsBlock && HasWord(classes, "caption")) {
                m_BlockKind = BlockKind::Caption;
            } else if (startsBlock && (HasWord(classes, "filename") || HasWord(classes, "file-name"))) {
                m_BlockKind = BlockKind::FileName;
            } else if (Mark const mark = MarkOfClass(classes); Mark::None != mark) {
                tag.m_Marks = mark;
            }
        } else if (Mark::None == tag.m_Marks && "a" != token.m_Name && "abbr" != token.m_Name &&
                   "time" != token.m_Name) {
            Warn("html-unknown", line,
                 Text("The tag <%1> has no meaning in print; its text is set as it stands.", "Source", token.m_Name));
        }
        EnterMark(tag.m_Marks, true);
        m_Tags.push_back(std::move(tag));
    }
}

void ChapterReader::CloseTag(std::string const & name)
{
    auto const open =
        std::find_if(m_Tags.rbegin(), m_Tags.rend(), [&](OpenTag const & tag) { return tag.m_Name == name; });
    if (open == m_Tags.rend()) {
        return;
    }
    if (open->m_IsLink) {
        Builder().SetLink(open->m_OuterLink);
    }
    if ("q" == name) {
        Builder().Append(u'"');
    }
    EnterMark(open->m_Marks, false);
    m_Tags.erase(std::next(open).base());
}

void ChapterReader::CloseAllTags()
{
    while (!m_Tags.empty()) {
        OpenTag const & tag = m_Tags.back();
        if (Mark::None != tag.m_Marks || tag.m_IsLink) {
            Warn("html-open", tag.m_Line,
                 Text("The tag <%1> is not closed in its paragraph; it ends there.", "Source", tag.m_Name));
        }
        CloseTag(std::string(tag.m_Name));
    }
}

void ChapterReader::ReadImageTag(HtmlToken const & token, int line)
{
    std::string const & source = token.Value("src");
    if (source.empty()) {
        Warn("picture-missing", line, Text("A picture names no file (src) and is left out.", "Source"));
        return;
    }
    Picture picture;
    picture.m_Path = DecodePercent(source);
    picture.m_Alternative = token.Value("alt");
    std::replace(picture.m_Alternative.begin(), picture.m_Alternative.end(), '\n', ' ');
    picture.m_Line = line + m_LineOffset;
    std::string const & width = token.Value("width");
    if (!width.empty() && !ReadWidth(width, picture.m_WidthShare, picture.m_Width)) {
        Warn("picture-width", line,
             Text("The width \"%1\" is not a length or a percentage; the picture keeps its size.", "Source", width));
    }
    m_Chapter.m_Pictures.push_back(std::move(picture));
    m_PictureCaptions.emplace_back();
    Builder().AddObject(ObjectKind::Picture, static_cast<std::uint32_t>(m_Chapter.m_Pictures.size() - 1));
}

InlineText ChapterReader::ReadCaption(std::string const & label, std::string const & text, int line)
{
    ReadOptions options = m_Options;
    options.m_Language = m_Chapter.m_FrontMatter.m_Language;
    MessageList inner;
    ChapterText chapter = ReadMarkdown(text, options, inner);
    for (Message message : inner.All()) {
        message.m_Place = PlaceAt(line);
        m_Messages.Add(message.m_Severity, message.m_Kind, message.m_Place, message.m_Text);
    }
    std::u16string const before = ToUtf16(label);
    auto const shift = static_cast<std::uint32_t>(before.size());
    if (chapter.m_Blocks.empty()) {
        return {before, {{0, shift, Mark::None, -1}}, {}};
    }
    // Links of a caption join the chapter's; its other objects have no place in a caption.
    InlineText result = std::move(chapter.m_Blocks.front().m_Text);
    auto const base = static_cast<std::int32_t>(m_Chapter.m_Links.size());
    for (Span & span : result.m_Spans) {
        span.m_Link += 0 <= span.m_Link ? base : 0;
        span.m_Start += shift;
    }
    if (0 < shift) {
        result.m_Text.insert(0, before);
        result.m_Spans.insert(result.m_Spans.begin(), {0, shift, Mark::None, -1});
    }
    for (Link & link : chapter.m_Links) {
        link.m_Line = line + m_LineOffset;
        m_Chapter.m_Links.push_back(std::move(link));
    }
    result.m_Objects.clear();
    std::replace(result.m_Text.begin(), result.m_Text.end(), u'\uFFFC', u' ');
    return result;
}

void ChapterReader::ReadListingTag(HtmlToken const & token, int line)
{
    if (HtmlToken::Kind::CloseTag == token.m_Kind) {
        if (!m_ListingCaption.empty() || !m_ListingLabel.empty()) {
            Block & block = Emit(BlockKind::Caption, line);
            block.m_Text = ReadCaption(std::exchange(m_ListingLabel, std::string()),
                                       std::exchange(m_ListingCaption, std::string()), line);
            PlacePendingAnchors(block);
        }
        return;
    }
    std::string const & number = token.Value("number");
    if (!number.empty()) {
        std::string const id = "listing-" + number;
        if (m_Slugs.Take(id)) {
            m_Chapter.m_Anchors.push_back({id, line + m_LineOffset});
            m_PendingAnchors.push_back(static_cast<std::uint32_t>(m_Chapter.m_Anchors.size() - 1));
        }
    }
    if (std::string const & file = token.Value("file-name"); !file.empty()) {
        InlineBuilder builder;
        builder.Append(ToUtf16(file), true);
        Block & block = Emit(BlockKind::FileName, line);
        block.m_Text = builder.Finish();
        PlacePendingAnchors(block);
    }
    m_ListingCaption = token.Value("caption");
    m_ListingLabel = number.empty() ? "" : "Listing " + number + (m_ListingCaption.empty() ? "" : ": ");
}

void ChapterReader::FinishHtmlParagraph(int line)
{
    if (Builder().Text().find_first_not_of(u" \n\u2028") != std::u16string::npos || !Builder().Objects().empty()) {
        EmitText(0 < m_HtmlHeading ? BlockKind::Heading : m_BlockKind, m_HtmlHeading, line);
    } else {
        FinishInline();
        Builder().Finish();
    }
    m_BlockKind = BlockKind::Paragraph;
    m_HtmlHeading = 0;
}

bool ChapterReader::ReadBlockTag(HtmlToken const & token, int line)
{
    bool const isClosing = HtmlToken::Kind::CloseTag == token.m_Kind;
    std::string const & name = token.m_Name;
    bool const isHeading = 2 == name.size() && 'h' == name[0] && '1' <= name[1] && name[1] <= '6';
    bool const isStructure = Contains(g_StructureTags, name);
    if (!isHeading && !isStructure && !Contains(g_ParagraphTags, name) && "hr" != name && "listing" != name &&
        "figcaption" != name && "summary" != name && "pre" != name) {
        return false;
    }
    FinishHtmlParagraph(line);
    if ("hr" == name) {
        Emit(BlockKind::Rule, line);
    } else if ("listing" == name) {
        ReadListingTag(token, line);
    } else if (!isClosing) {
        m_HtmlHeading = isHeading ? name[1] - '0' : 0;
        m_BlockKind = "figcaption" == name ? BlockKind::Caption : BlockKind::Paragraph;
        if ("summary" == name) {
            Builder().SetMarks(Mark::Strong);
            m_Open[1] = 1;
        }
        if (!token.Value("id").empty()) {
            AddAnchorAt(0, token.Value("id"), line);
        }
        if (isStructure && ("table" == name || "ul" == name || "ol" == name || "dl" == name)) {
            Warn("html-structure", line,
                 Text("A raw <%1> is set as plain paragraphs; write it in Markdown to keep its form.", "Source", name));
        }
    }
    return true;
}

void ChapterReader::ReadHtmlBlock(cmark_node * node)
{
    RememberLines(node);
    int const first = cmark_node_get_start_line(node);
    std::vector<HtmlToken> const tokens = TokeniseHtml(cmark_node_get_literal(node));
    std::string_view skipped;
    Builder().StartLine(first);
    for (HtmlToken const & token : tokens) {
        int const line = first + token.m_LineOffset;
        bool const isTag = HtmlToken::Kind::OpenTag == token.m_Kind || HtmlToken::Kind::CloseTag == token.m_Kind;
        if (isTag && ("script" == token.m_Name || "style" == token.m_Name)) {
            bool const isOpen = HtmlToken::Kind::OpenTag == token.m_Kind && !token.m_IsSelfClosing;
            skipped = isOpen ? std::string_view(token.m_Name) : std::string_view();
            if (isOpen) {
                Warn("html-unknown", line,
                     Text("A <%1> has no meaning in print and is left out with its content.", "Source", token.m_Name));
            }
        } else if (!skipped.empty() || HtmlToken::Kind::Comment == token.m_Kind) {
            continue;
        } else if (isTag) {
            if (!ReadBlockTag(token, line)) {
                ReadTag(token, line);
            }
        } else {
            std::string text = token.m_Text;
            bool const isBlank = std::string::npos == text.find_first_not_of(" \t\r\n");
            if (!isBlank || !Builder().Empty()) {
                AppendText(text, false);
            }
        }
    }
    FinishHtmlParagraph(first);
}

}
