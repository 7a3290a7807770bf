#include "Describe.h"

#include "import/MarkdownReader.h"
#include "import/SourceText.h"

using namespace Import;

namespace
{

std::string MarksText(Mark marks)
{
    static char const * const names[] = {"em", "strong", "strike", "code",      "sub",      "sup",
                                         "u",  "kbd",    "small",  "smallcaps", "highlight"};
    std::string text;
    for (int bit = 0; bit < 11; ++bit) {
        if (Has(marks, static_cast<Mark>(1 << bit))) {
            text += (text.empty() ? "" : "+") + std::string(names[bit]);
        }
    }
    return text;
}

std::string Joined(std::vector<std::string> const & parts)
{
    std::string text;
    for (std::string const & part : parts) {
        text += (text.empty() ? "" : "!") + part;
    }
    return text;
}

std::string ObjectText(ChapterText const & chapter, InlineObject const & object)
{
    switch (object.m_Kind) {
    case ObjectKind::NoteReference:
        return "<note " + std::to_string(object.m_Index) + ">";
    case ObjectKind::Picture:
        return "<picture " + chapter.m_Pictures[object.m_Index].m_Path + ">";
    case ObjectKind::Anchor:
        return "<anchor " + chapter.m_Anchors[object.m_Index].m_Id + ">";
    case ObjectKind::IndexMark:
        break;
    }
    IndexMark const & mark = chapter.m_IndexMarks[object.m_Index];
    return "<index " + Joined(mark.m_Topic) + (mark.m_See.empty() ? "" : " see " + Joined(mark.m_See)) + ">";
}

std::string BlockText(ChapterText const & chapter, Block const & block)
{
    std::string line(static_cast<std::size_t>(block.m_QuoteDepth), '>');
    line += std::string(block.m_ListDepth * 2u, ' ');
    switch (block.m_ListMark) {
    case ListMark::None:
        break;
    case ListMark::Bullet:
        line += "- ";
        break;
    case ListMark::Number:
        line += std::to_string(block.m_Number) + block.m_NumberDelimiter + " ";
        break;
    case ListMark::TaskOpen:
        line += "[ ] ";
        break;
    case ListMark::TaskDone:
        line += "[x] ";
        break;
    }
    static char const * const names[] = {"p", "h", "code", "rule", "table", "figure", "caption", "file", "box"};
    line += names[static_cast<int>(block.m_Kind)];
    line += BlockKind::Heading == block.m_Kind ? std::to_string(block.m_Level) : "";
    line += block.m_CodeLanguage.empty() ? "" : ":" + block.m_CodeLanguage;
    std::string const text = Describe(chapter, block.m_Text);
    line += text.empty() ? "\n" : " " + text + "\n";
    if (block.m_Table) {
        for (auto const & row : block.m_Table->m_Rows) {
            line += " ";
            for (TableCell const & cell : row) {
                line += " |" + Describe(chapter, cell.m_Text);
            }
            line += '\n';
        }
    }
    return line;
}

}

std::string Describe(ChapterText const & chapter, InlineText const & text)
{
    std::string result;
    std::size_t object = 0;
    for (Span const & span : text.m_Spans) {
        std::string const marks = MarksText(span.m_Marks);
        std::string const link =
            0 <= span.m_Link ? "](" + chapter.m_Links[static_cast<std::size_t>(span.m_Link)].m_Target + ")" : "";
        std::string inner;
        for (std::uint32_t at = span.m_Start; at < span.m_Start + span.m_Length;) {
            bool covered = false;
            for (; object < text.m_Objects.size() && text.m_Objects[object].m_Position == at; ++object) {
                inner += ObjectText(chapter, text.m_Objects[object]);
                ObjectKind const kind = text.m_Objects[object].m_Kind;
                bool const isInText = ObjectKind::NoteReference == kind || ObjectKind::Picture == kind;
                if (isInText && u'\uFFFC' == text.m_Text[at]) {
                    covered = true;
                    ++object;
                    break;
                }
            }
            std::uint32_t end = at + 1;
            bool const isPair = 0xD800 == (text.m_Text[at] & 0xFC00) && end < text.m_Text.size();
            end += isPair ? 1 : 0;
            std::u16string const unit = text.m_Text.substr(at, end - at);
            inner += covered ? "" : u"\u2028" == unit ? "/" : ToUtf8(unit);
            at = end;
        }
        inner = marks.empty() ? inner : "{" + marks + " " + inner + "}";
        result += link.empty() ? inner : "[" + inner + link;
    }
    for (; object < text.m_Objects.size(); ++object) {
        result += ObjectText(chapter, text.m_Objects[object]);
    }
    return result;
}

std::string Describe(ChapterText const & chapter)
{
    std::string text;
    for (Block const & block : chapter.m_Blocks) {
        text += BlockText(chapter, block);
    }
    for (std::size_t at = 0; at < chapter.m_Notes.size(); ++at) {
        text += "note " + std::to_string(at) + " " + chapter.m_Notes[at].m_Label + "\n";
        for (Block const & block : chapter.m_Notes[at].m_Blocks) {
            text += "  " + BlockText(chapter, block);
        }
    }
    return text;
}

std::string Describe(MessageList const & messages)
{
    std::string text;
    for (Message const & message : messages.All()) {
        text += std::to_string(message.m_Place.m_Line) + " " + message.m_Kind + "\n";
    }
    return text;
}

std::string ReadAndDescribe(std::string const & markdown, std::string * messages)
{
    MessageList list;
    ReadOptions options;
    options.m_ShownName = "a.md";
    ChapterText const chapter = ReadMarkdown(markdown, options, list);
    if (messages) {
        list.SortByPlace();
        *messages = Describe(list);
    }
    return Describe(chapter);
}
