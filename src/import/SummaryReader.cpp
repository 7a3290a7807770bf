#include "import/BookPlan.h"
#include "import/MarkdownTree.h"
#include "import/Text.h"

namespace Import
{

namespace
{

/// Walks a table of contents in mdBook's layout and adds its chapters to the plan in reading order.
class SummaryReader
{
public:
    SummaryReader(std::string const & file, BookPlan & plan, MessageList & messages)
        : m_File(file),
          m_Plan(plan),
          m_Messages(messages)
    {
    }

    void Read(cmark_node * root)
    {
        cmark_iter * iterator = cmark_iter_new(root);
        for (cmark_event_type event; CMARK_EVENT_DONE != (event = cmark_iter_next(iterator));) {
            cmark_node * node = cmark_iter_get_node(iterator);
            bool const isEnter = CMARK_EVENT_ENTER == event;
            switch (cmark_node_get_type(node)) {
            case CMARK_NODE_LIST:
                EnterList(isEnter);
                break;
            case CMARK_NODE_ITEM:
                m_Numbers.back() += isEnter ? 1 : 0;
                break;
            case CMARK_NODE_HEADING:
                if (isEnter) {
                    TakeHeading(node);
                }
                break;
            case CMARK_NODE_LINK:
                if (isEnter) {
                    TakeLink(node);
                }
                break;
            default:
                break;
            }
        }
        cmark_iter_free(iterator);
        if (!m_Part.empty()) {
            m_Messages.Warn("empty-part", m_PartPlace,
                            Text("The part \"%1\" has no chapter and is left out.", "Source", m_Part));
        }
    }

private:
    Place PlaceOf(cmark_node * node) const
    {
        for (; node && 0 == cmark_node_get_start_line(node); node = cmark_node_parent(node)) {
        }
        return {m_File, node ? cmark_node_get_start_line(node) : 0, node ? cmark_node_get_start_column(node) : 0};
    }

    void EnterList(bool isEnter)
    {
        if (!isEnter) {
            if (1 == m_Numbers.size()) {
                m_LastNumber = m_Numbers.front();
            }
            m_Numbers.pop_back();
            return;
        }
        // Numbers run on over parts: only a list within a list starts anew.
        m_Numbers.push_back(m_Numbers.empty() ? m_LastNumber : 0);
    }

    void TakeHeading(cmark_node * node)
    {
        std::string const text = PlainText(node);
        if (!m_HasTitle && m_Plan.m_Chapters.empty() && 1 == cmark_node_get_heading_level(node)) {
            m_HasTitle = true;
            // "Summary" is what mdBook's own template calls the page, not the book.
            if (m_Plan.m_Title.empty() && "Summary" != text) {
                m_Plan.m_Title = text;
            }
            return;
        }
        m_Part = text;
        m_PartPlace = PlaceOf(node);
    }

    void TakeLink(cmark_node * node)
    {
        Place const place = PlaceOf(node);
        std::string const title = PlainText(node);
        std::string target = DecodePercent(cmark_node_get_url(node));
        if (target.empty()) {
            m_Messages.Note("draft-chapter", place, Text("\"%1\" has no file yet and is left out.", "Source", title));
            return;
        }
        if (std::string::npos != target.find("://")) {
            m_Messages.Warn("chapter-remote", place,
                            Text("\"%1\" is not a file of this folder and is left out.", "Source", target));
            return;
        }
        if (std::size_t const hash = target.find('#'); std::string::npos != hash) {
            m_Messages.Warn(
                "chapter-anchor", place,
                Text("A chapter is a whole file; the part \"%1\" is ignored.", "Source", target.substr(hash)));
            target.resize(hash);
        }
        if (target.empty() || !AddChapter(m_Plan, target, place, m_Messages)) {
            return;
        }
        PlannedChapter & chapter = m_Plan.m_Chapters.back();
        chapter.m_Title = title;
        chapter.m_Part = std::move(m_Part);
        m_Part.clear();
        for (int number : m_Numbers) {
            chapter.m_Number += (chapter.m_Number.empty() ? "" : ".") + std::to_string(number);
        }
    }

    std::string const & m_File;
    BookPlan & m_Plan;
    MessageList & m_Messages;
    bool m_HasTitle = false;
    std::string m_Part;
    Place m_PartPlace;
    /// Number of the present item at each depth of lists.
    std::vector<int> m_Numbers;
    int m_LastNumber = 0;
};

}

bool ReadSummaryText(std::string const & text, std::string const & shownName, BookPlan & plan, MessageList & messages)
{
    MarkdownTree const tree = ParseMarkdown(text);
    SummaryReader(shownName, plan, messages).Read(tree.get());
    return true;
}

}
