#include "framework/document/UpdateCrossReferencesCommandHelper.h"

#include "framework/document/DocumentController.h"
#include "framework/kernel/Path.h"
#include "framework/story/ListAtt.h"

#include <algorithm>

namespace
{

/// Text of the paragraph, without its end.
String ParagraphText(Story::Story const & story, std::size_t paragraph)
{
    std::size_t const begin = story.GetParagraphBegin(paragraph);
    std::size_t end = story.GetParagraphs()[paragraph].m_End;
    if (begin < end && Story::ParagraphEnd == story.GetText()[end - 1]) {
        --end;
    }
    return story.GetString(begin, end);
}

/// The number of a numbered item: items of its list and level before it count up to it.
int ItemNumber(Story::Story const & story, std::size_t paragraph, Story::ListAtt const & item)
{
    int number = item.GetStartNumberingAt() - 1;
    bool isFirst = true;
    for (std::size_t i = 0; i <= paragraph; ++i) {
        Kernel::Counted<Story::ParagraphAtts const> const & atts = story.GetParagraphs()[i].m_Atts;
        Kernel::NonCounted<Story::ListAtt const> const list = atts ? atts->GetListAtt() : nullptr;
        if (list && list->GetName() == item.GetName() && list->GetLevel() == item.GetLevel() &&
            list->GetKind() == item.GetKind()) {
            number = isFirst || list->IsRestartNumbering() ? list->GetStartNumberingAt() : number + 1;
            isFirst = false;
        }
    }
    return number;
}

}

void UpdateCrossReferencesCommandHelper::FillAnchorInfo(AnchorInfo & info, Kernel::Counted<AnchorInstance const> anchor,
                                                        Kernel::Counted<DocumentController const> document)
{
    DocumentNode const & node = *document->GetDocument();
    info.m_ReferenceText4 = document->GetMetadata()->GetTitle();
    info.m_ReferenceText6 = Kernel::Path::GetFileNameWithoutExtension(document->GetPath());
    if (anchor->IsBlind() || anchor->GetTextFlow()->GetStory()->Empty()) {
        return;
    }
    Story::Story const & story = *anchor->GetTextFlow()->GetStory();
    std::size_t const paragraph = story.GetParagraphIndex(std::min(anchor->GetOffset(), story.GetLength() - 1));
    info.m_ReferenceText1 = ParagraphText(story, paragraph);
    Story::Story::Paragraph const & own = story.GetParagraphs()[paragraph];
    if (Kernel::NonCounted<Story::ListAtt const> const list = own.m_Atts ? own.m_Atts->GetListAtt() : nullptr;
        list && Story::ListAtt::Numbered == list->GetKind()) {
        info.m_ReferenceText2 = list->FormatMarker(ItemNumber(story, paragraph, *list));
    }
    if (Kernel::JailCounted<TextFrameNode> const frame = anchor->GetTextFlow()->FindFrame(anchor->GetOffset())) {
        if (int const page = frame->GetPageIndex(); 0 <= page) {
            info.m_ReferenceText3 = node.GetFormattedPageNumber(static_cast<unsigned int>(page));
        }
    }
    if (Kernel::Counted<Story::Layout const> const layout = anchor->GetTextFlow()->GetLayout()) {
        // An anchor stands inside of its own heading, so the end of its paragraph is what counts.
        auto const headings = layout->GetHeadings();
        auto const after = std::find_if(headings.begin(), headings.end(),
                                        [&own](auto const & heading) { return own.m_End <= heading.m_StoryOffset; });
        if (after != headings.begin()) {
            info.m_ReferenceText5 = layout->GetString(std::prev(after)->m_Text);
        }
    }
}
