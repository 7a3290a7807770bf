// Look-ups from places in chapters to output pages.

#include "core/BookChapter.h"
#include "core/BookController.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/DocumentSection.h"
#include "framework/document/SpreadNode.h"
#include "framework/render/PrintersMarks.h"
#include "output/ExportBookCommand.h"

#include <algorithm>

namespace Book
{

int ExportBookCommand::IndexFromChapter(Kernel::Counted<BookChapter const> chapter) const
{
    auto const found = std::find(m_Chapters.begin(), m_Chapters.end(), chapter);
    return found == m_Chapters.end() ? -1 : static_cast<int>(found - m_Chapters.begin());
}

int ExportBookCommand::GetChapterOffset(int chapterIndex) const
{
    for (std::size_t page = 0; page < m_ExportMap.size(); ++page) {
        for (ExportPageRef const & ref : m_ExportMap[page]) {
            if (ref.m_Chapter == chapterIndex && !ref.IsPadding()) {
                return static_cast<int>(page);
            }
        }
    }
    return -1;
}

Kernel::Size ExportBookCommand::GetChapterFirstPageOffset(int chapterIndex) const
{
    for (ExportPageEntry const & entry : m_ExportMap) {
        for (ExportPageRef const & ref : entry) {
            if (ref.m_Chapter == chapterIndex && !ref.IsPadding()) {
                return ref.m_Offset;
            }
        }
    }
    return {};
}

ExportBookCommand::AnchorTarget * ExportBookCommand::GetAnchorTarget(String const & uid)
{
    auto const found = m_AnchorTargets.find(uid);
    return found == m_AnchorTargets.end() ? nullptr : &found->second;
}

Kernel::Counted<Renderer::PrintersMarksHelper> ExportBookCommand::GetPrintersMarksForTarget(int page) const
{
    bool const inRange = page >= 1 && static_cast<std::size_t>(page) <= m_PrintersMarks.size();
    return inRange ? m_PrintersMarks[static_cast<std::size_t>(page) - 1] : nullptr;
}

std::pair<int, ExportPageRef const *> ExportBookCommand::FindSpread(int chapterIndex, int spread) const
{
    if (chapterIndex < 0 || static_cast<std::size_t>(chapterIndex) >= m_FirstEntries.size()) {
        return {-1, nullptr};
    }
    std::vector<int> const & spreads = m_FirstEntries[static_cast<std::size_t>(chapterIndex)];
    int const page = spread >= 0 && static_cast<std::size_t>(spread) < spreads.size()
                         ? spreads[static_cast<std::size_t>(spread)]
                         : -1;
    if (page == -1) {
        return {-1, nullptr};
    }
    ExportPageEntry const & entry = m_ExportMap[static_cast<std::size_t>(page)];
    auto const ref = std::find_if(entry.begin(), entry.end(), [&](ExportPageRef const & candidate) {
        return candidate.m_Chapter == chapterIndex && candidate.m_Spread == spread;
    });
    return {page + 1, &*ref};
}

int ExportBookCommand::OutputPageFromSpreadPos(Kernel::Counted<BookChapter const> chapter, int spread,
                                               Kernel::Point & position) const
{
    auto const [page, ref] = FindSpread(IndexFromChapter(chapter), spread);
    if (ref) {
        position.x += ref->m_Offset.width;
        position.y += ref->m_Offset.height;
    }
    return page;
}

int ExportBookCommand::OutputPageFromSpreadRect(Kernel::Counted<DocumentController const> document,
                                                Kernel::JailCounted<SpreadNode> spread, Kernel::Rect & rect)
{
    Kernel::Counted<BookChapter const> const chapter = GetBookController()->GetChapterFromDocumentController(document);
    auto const [page, ref] = FindSpread(IndexFromChapter(chapter), document->GetDocument()->FindSpread(spread));
    if (ref) {
        rect = rect.Moved(ref->m_Offset.width, ref->m_Offset.height);
    }
    return page;
}

int ExportBookCommand::OutputPageFromPageIndex(Kernel::Counted<DocumentController const> document, int pageIndex)
{
    Kernel::Counted<BookChapter const> const chapter = GetBookController()->GetChapterFromDocumentController(document);
    return FindSpread(IndexFromChapter(chapter), document->GetDocument()->GetSpreadIndexForPageIndex(pageIndex)).first;
}

int ExportBookCommand::OutputPageFromSectionIndex(Kernel::Counted<DocumentController const> document, int sectionIndex)
{
    Kernel::Counted<DocumentSection const> const section = document->GetDocument()->GetSection(sectionIndex);
    return section ? OutputPageFromPageIndex(document, static_cast<int>(section->GetStartPageIndex())) : -1;
}

int ExportBookCommand::OutputPageFromChapterPage(int bookChapterIndex, int pageInChapter)
{
    Kernel::Counted<BookChapter const> const chapter = GetBookController()->GetChapterAtIndex(bookChapterIndex);
    if (!chapter || pageInChapter < 0) {
        return -1;
    }
    int spread = 0;
    Snapshot<std::vector<SpreadInfo>> const spreads = chapter->GetSpreadInfo();
    for (SpreadInfo const & info : spreads) {
        int const pages = static_cast<int>(info.m_PageRects.size());
        if (pageInChapter < pages) {
            return FindSpread(IndexFromChapter(chapter), spread).first;
        }
        pageInChapter -= pages;
        ++spread;
    }
    return -1;
}

}
