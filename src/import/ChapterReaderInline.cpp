#include "import/AttributeReader.h"
#include "import/ChapterReader.h"
#include "import/SourceText.h"
#include "import/Text.h"

#include <algorithm>

namespace Import
{

namespace
{

struct ClassMark
{
    std::string_view m_Name;
    Mark m_Mark;
};

constexpr std::array g_ClassMarks{
    ClassMark{"smallcaps", Mark::SmallCaps}, ClassMark{"underline", Mark::Underline}, ClassMark{"ul", Mark::Underline},
    ClassMark{"mark", Mark::Highlight},      ClassMark{"kbd", Mark::Keyboard},        ClassMark{"code", Mark::Code},
    ClassMark{"small", Mark::Small},         ClassMark{"emphasis", Mark::Emphasis},   ClassMark{"em", Mark::Emphasis},
    ClassMark{"strong", Mark::Strong},
};

/// Words that ask for what only a generated reference can give.
constexpr std::array<std::string_view, 2> g_ReferenceClasses{"page", "title"};
constexpr std::array<std::string_view, 3> g_NoteClasses{"endnote", "footnote", "sidenote"};

std::vector<std::string> SplitTopic(std::string_view text)
{
    std::vector<std::string> parts;
    for (;;) {
        std::size_t const end = text.find('!');
        std::string part(text.substr(0, end));
        part.erase(0, part.find_first_not_of(' '));
        part.resize(std::min(part.size(), part.find_last_not_of(' ') + 1));
        if (!part.empty()) {
            parts.push_back(std::move(part));
        }
        if (std::string_view::npos == end) {
            return parts;
        }
        text.remove_prefix(end + 1);
    }
}

}

Mark ChapterReader::MarkOfClass(std::string_view name)
{
    for (auto const & [known, mark] : g_ClassMarks) {
        if (known == name) {
            return mark;
        }
    }
    return Mark::None;
}

void ChapterReader::UpdateLook()
{
    int marks = 0;
    for (std::size_t bit = 0; bit < m_Open.size(); ++bit) {
        marks |= 0 < m_Open[bit] ? 1 << bit : 0;
    }
    Builder().SetMarks(static_cast<Mark>(marks));
}

void ChapterReader::EnterMark(Mark mark, bool isEnter)
{
    for (std::size_t bit = 0; bit < m_Open.size(); ++bit) {
        if (Has(mark, static_cast<Mark>(1 << bit))) {
            m_Open[bit] += isEnter ? 1 : -1;
        }
    }
    UpdateLook();
}

void ChapterReader::VisitInline(cmark_node * node, bool isEnter)
{
    switch (cmark_node_get_type(node)) {
    case CMARK_NODE_EMPH:
        EnterMark(Mark::Emphasis, isEnter);
        return;
    case CMARK_NODE_STRONG:
        EnterMark(Mark::Strong, isEnter);
        return;
    case CMARK_NODE_LINK:
        EnterLink(node, isEnter);
        return;
    case CMARK_NODE_IMAGE:
        EnterPicture(node, isEnter);
        return;
    default:
        break;
    }
    if (IsStrikethrough(node)) {
        EnterMark(Mark::Strike, isEnter);
        return;
    }
    if (!isEnter) {
        return;
    }
    switch (cmark_node_get_type(node)) {
    case CMARK_NODE_TEXT:
        AppendText(cmark_node_get_literal(node), false);
        break;
    case CMARK_NODE_CODE:
        EnterMark(Mark::Code, true);
        ReportDirectives(cmark_node_get_literal(node), cmark_node_get_start_line(node));
        AppendText(cmark_node_get_literal(node), true);
        EnterMark(Mark::Code, false);
        break;
    case CMARK_NODE_SOFTBREAK:
        Builder().Append(u'\n');
        Builder().StartLine(Builder().LineAt(Builder().Position()) + 1);
        break;
    case CMARK_NODE_LINEBREAK:
        Builder().Append(u'\u2028');
        Builder().StartLine(Builder().LineAt(Builder().Position()) + 1);
        break;
    case CMARK_NODE_HTML_INLINE:
        ReadInlineHtml(cmark_node_get_literal(node), Builder().LineAt(Builder().Position()));
        break;
    case CMARK_NODE_FOOTNOTE_REFERENCE:
        ReadNoteReference(node);
        break;
    default:
        break;
    }
}

void ChapterReader::AppendText(std::string_view text, bool isVerbatim)
{
    std::u16string wide = ToUtf16(text);
    auto const isControl = [](char16_t c) { return (c < u' ' && u'\t' != c && u'\n' != c) || u'\u007F' == c; };
    if (std::any_of(wide.begin(), wide.end(), isControl)) {
        std::erase_if(wide, isControl);
        if (!std::exchange(m_HasReportedControls, true)) {
            Warn("control-character", Builder().LineAt(Builder().Position()),
                 Text("Control characters in the text cannot be printed and are left out, here and later in the file.",
                      "Source"));
        }
    }
    std::replace(wide.begin(), wide.end(), u'\t', u' ');
    // The character that stands for objects can't stand for itself.
    std::replace(wide.begin(), wide.end(), u'\uFFFC', u'\uFFFD');
    Builder().Append(wide, isVerbatim);
}

void ChapterReader::EnterLink(cmark_node * node, bool isEnter)
{
    if (isEnter) {
        m_LinkStarts.push_back(Builder().Position());
        std::string target = cmark_node_get_url(node);
        m_Chapter.m_Links.push_back({std::move(target), Builder().LineAt(Builder().Position()) + m_LineOffset, false});
        Builder().SetLink(static_cast<std::int32_t>(m_Chapter.m_Links.size() - 1));
        return;
    }
    std::uint32_t const start = m_LinkStarts.back();
    m_LinkStarts.pop_back();
    std::int32_t const index = Builder().GetLink();
    if (0 <= index && start == Builder().Position()) {
        Link & link = m_Chapter.m_Links[static_cast<std::size_t>(index)];
        link.m_IsEmpty = true;
        m_Messages.Warn(
            "later-reference", {m_Options.m_ShownName, link.m_Line},
            Text("A reference without a text of its own cannot be filled in yet; its target is set in its place.",
                 "Source"));
        Builder().Append(ToUtf16(link.m_Target), true);
    }
    m_Spots.push_back({start, Builder().Position(), index, -1});
    Builder().SetLink(-1);
}

void ChapterReader::EnterPicture(cmark_node * node, bool isEnter)
{
    if (isEnter) {
        int const line = Builder().LineAt(Builder().Position());
        m_Builders.emplace_back();
        m_SpotsOutside.push_back(m_Spots.size());
        Builder().StartLine(line);
        UpdateLook();
        return;
    }
    // What was marked inside of the alternative text has no place outside of it.
    m_Spots.resize(m_SpotsOutside.back());
    m_SpotsOutside.pop_back();
    ReadBracketedSpans();
    if (m_Options.m_Smart) {
        Builder().Apply(m_Smart.FindEdits(Builder().Text(), Builder().VerbatimMask()));
    }
    InlineText caption = Builder().Finish();
    m_Builders.pop_back();
    Picture picture;
    picture.m_Path = DecodePercent(cmark_node_get_url(node));
    picture.m_Line = Builder().LineAt(Builder().Position()) + m_LineOffset;
    std::u16string plain = caption.m_Text;
    std::erase(plain, u'\uFFFC');
    picture.m_Alternative = ToUtf8(plain);
    m_Chapter.m_Pictures.push_back(std::move(picture));
    m_PictureCaptions.push_back(std::move(caption));
    std::uint32_t const start = Builder().Position();
    auto const index = static_cast<std::uint32_t>(m_Chapter.m_Pictures.size() - 1);
    Builder().AddObject(ObjectKind::Picture, index);
    m_Spots.push_back({start, Builder().Position(), -1, static_cast<std::int32_t>(index)});
}

void ChapterReader::ReadNoteReference(cmark_node * node)
{
    int const number = std::atoi(cmark_node_get_literal(node));
    if (number < 1) {
        return;
    }
    if (m_Chapter.m_Notes.size() < static_cast<std::size_t>(number)) {
        m_Chapter.m_Notes.resize(static_cast<std::size_t>(number));
    }
    Builder().AddObject(ObjectKind::NoteReference, static_cast<std::uint32_t>(number - 1));
}

void ChapterReader::AddAnchorAt(std::uint32_t position, std::string const & id, int line)
{
    if (!m_Slugs.Take(id)) {
        Warn("anchor-twice", line,
             Text("The anchor #%1 exists already in this chapter; links lead to the first one.", "Source", id));
        return;
    }
    m_Chapter.m_Anchors.push_back({id, line + m_LineOffset});
    Builder().AddObjectAt(position, ObjectKind::Anchor, static_cast<std::uint32_t>(m_Chapter.m_Anchors.size() - 1));
}

Attributes ChapterReader::TakeHeadingAttributes()
{
    std::u16string const & text = Builder().Text();
    std::size_t const end = text.find_last_not_of(u" \n") + 1;
    std::size_t const start = text.rfind(u'{');
    if (std::u16string::npos == start || Builder().IsVerbatim(start) || 0 == end || u'}' != text[end - 1]) {
        return {};
    }
    std::size_t length = 0;
    auto attributes = ReadAttributes(std::u16string_view(text).substr(start), length);
    if (!attributes || start + length != end) {
        return {};
    }
    std::size_t const from = text.find_last_not_of(u' ', 0 < start ? start - 1 : 0) + 1;
    Builder().Apply({{static_cast<std::uint32_t>(std::min(from, start)),
                      static_cast<std::uint32_t>(end - std::min(from, start)),
                      {}}});
    return std::move(*attributes);
}

void ChapterReader::ApplyToLink(AttributeSpot const & spot, Attributes const & attributes, int line)
{
    for (std::string_view const name : g_ReferenceClasses) {
        if (attributes.HasClass(name)) {
            Warn("later-reference", line,
                 Text("References by .%1 cannot be filled in yet; the link's own text is set.", "Source", name));
        }
    }
    Attributes rest = attributes;
    std::erase_if(rest.m_Classes, [](std::string const & name) {
        return std::find(g_ReferenceClasses.begin(), g_ReferenceClasses.end(), name) != g_ReferenceClasses.end();
    });
    ApplyToSpan(spot.m_Start, spot.m_End, rest, line);
}

void ChapterReader::ApplyToPicture(std::uint32_t index, Attributes const & attributes, int line)
{
    Picture & picture = m_Chapter.m_Pictures[index];
    for (auto const & [key, value] : attributes.m_Values) {
        if ("width" == key && !ReadWidth(value, picture.m_WidthShare, picture.m_Width)) {
            Warn(
                "picture-width", line,
                Text("The width \"%1\" is not a length or a percentage; the picture keeps its size.", "Source", value));
        } else if ("page" == key && !ReadPageNumber(value, picture.m_Page)) {
            Warn("picture-page", line,
                 Text("\"%1\" is no page of a PDF, which count from 1; the first one is set.", "Source", value));
        }
    }
}

void ChapterReader::AddIndexMark(std::uint32_t start, std::u16string_view text, Attributes const & attributes, int line)
{
    IndexMark mark;
    std::string const * topic = attributes.Find("topic");
    std::string plain = ToUtf8(text);
    std::erase_if(plain, [](char c) { return '\n' == c; });
    mark.m_Topic = topic ? SplitTopic(*topic) : std::vector<std::string>{plain};
    if (std::string const * see = attributes.Find("see")) {
        mark.m_See = SplitTopic(*see);
    }
    mark.m_Line = line + m_LineOffset;
    if (mark.m_Topic.empty() || mark.m_Topic.front().empty()) {
        Warn("index-empty", line, Text("The index mark names no topic and is left out.", "Source"));
        return;
    }
    m_Chapter.m_IndexMarks.push_back(std::move(mark));
    Builder().AddObjectAt(start, ObjectKind::IndexMark, static_cast<std::uint32_t>(m_Chapter.m_IndexMarks.size() - 1));
}

void ChapterReader::ApplyToSpan(std::uint32_t start, std::uint32_t end, Attributes const & attributes, int line)
{
    if (!attributes.m_Id.empty()) {
        AddAnchorAt(start, attributes.m_Id, line);
    }
    for (std::string const & name : attributes.m_Classes) {
        if (Mark const mark = MarkOfClass(name); Mark::None != mark) {
            Builder().AddMarks(start, end, mark);
        } else if ("index" == name) {
            AddIndexMark(start, std::u16string_view(Builder().Text()).substr(start, end - start), attributes, line);
        } else if (std::find(g_NoteClasses.begin(), g_NoteClasses.end(), name) != g_NoteClasses.end()) {
            Warn("later-notes", line,
                 Text("Notes are set at the end of the chapter; .%1 has no effect yet.", "Source", name));
        } else {
            Warn("class-unknown", line,
                 Text("The class .%1 has no look of its own; the text is set as it stands.", "Source", name));
        }
    }
}

void ChapterReader::ReadSpots()
{
    // From the back, so that the removal of one list moves no other spot.
    for (auto spot = m_Spots.rbegin(); spot != m_Spots.rend(); ++spot) {
        std::u16string_view const text = Builder().Text();
        if (spot->m_End < text.size() && u'{' == text[spot->m_End] && !Builder().IsVerbatim(spot->m_End)) {
            std::size_t length = 0;
            auto const attributes = ReadAttributes(text.substr(spot->m_End), length);
            if (attributes) {
                int const line = Builder().LineAt(spot->m_End);
                Builder().Apply({{spot->m_End, static_cast<std::uint32_t>(length), {}}});
                if (0 <= spot->m_Picture) {
                    ApplyToPicture(static_cast<std::uint32_t>(spot->m_Picture), *attributes, line);
                } else {
                    ApplyToLink(*spot, *attributes, line);
                }
            }
        }
    }
    m_Spots.clear();
    ReadBracketedSpans();
}

void ChapterReader::ReadBracketedSpans()
{
    std::size_t from = 0;
    for (;;) {
        std::u16string_view const text = Builder().Text();
        std::size_t const close = text.find(u"]{", from);
        if (std::u16string_view::npos == close) {
            return;
        }
        from = close + 1;
        std::size_t length = 0;
        auto const attributes =
            Builder().IsVerbatim(close) ? std::nullopt : ReadAttributes(text.substr(close + 1), length);
        if (!attributes) {
            continue;
        }
        int depth = 1;
        std::size_t open = close;
        while (0 < open && 0 < depth) {
            --open;
            if (!Builder().IsVerbatim(open)) {
                depth += u']' == text[open] ? 1 : u'[' == text[open] ? -1 : 0;
            }
        }
        if (0 != depth) {
            continue;
        }
        int const line = Builder().LineAt(open);
        auto const start = static_cast<std::uint32_t>(open);
        auto const end = static_cast<std::uint32_t>(close);
        Builder().Apply({{start, 1, {}}, {end, static_cast<std::uint32_t>(length + 1), {}}});
        ApplyToSpan(start, end - 1, *attributes, line);
        from = end - 1;
    }
}

void ChapterReader::ReportDirectives(std::string_view text, int line)
{
    for (std::size_t at = text.find("{{#"); std::string_view::npos != at; at = text.find("{{#", at + 3)) {
        std::string_view const directive = text.substr(at, text.find("}}", at) - at + 2);
        auto const lines = std::count(text.begin(), text.begin() + static_cast<std::ptrdiff_t>(at), '\n');
        Warn("directive", line + static_cast<int>(lines),
             Text("The directive %1 is not carried out; it is set as written.", "Source",
                  directive.substr(0, directive.find('\n'))));
    }
}

void ChapterReader::ReportLeftovers()
{
    std::u16string const & text = Builder().Text();
    for (std::size_t at = text.find(u"[^"); std::u16string::npos != at; at = text.find(u"[^", at + 2)) {
        std::size_t const end = text.find(u']', at);
        if (std::u16string::npos == end || at + 2 == end || Builder().IsVerbatim(at) ||
            std::u16string::npos != text.substr(at, end - at).find_first_of(u" \n")) {
            continue;
        }
        Warn("note-missing", Builder().LineAt(at),
             Text("The mark %1 has no note; it is set as written.", "Source", ToUtf8(text.substr(at, end - at + 1))));
    }
    if (std::u16string::npos != text.find(u"{{#")) {
        for (std::size_t at = text.find(u"{{#"); std::u16string::npos != at; at = text.find(u"{{#", at + 3)) {
            if (!Builder().IsVerbatim(at)) {
                std::size_t const end = std::min(text.find(u"}}", at), text.size() - 2) + 2;
                ReportDirectives(ToUtf8(text.substr(at, end - at)), Builder().LineAt(at));
            }
        }
    }
}

void ChapterReader::FinishInline()
{
    CloseAllTags();
    ReadSpots();
    ReportLeftovers();
    if (m_Options.m_Smart) {
        Builder().Apply(m_Smart.FindEdits(Builder().Text(), Builder().VerbatimMask()));
    }
    m_Open.fill(0);
}

}
