#include "core/BookController.h"
#include "framework/commands/PreflightCheckDocumentCommand.h"
#include "framework/document/BookEndnoteVisitor.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentControllerSession.h"
#include "framework/document/DocumentMetadata.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/IndexVisitor.h"
#include "framework/document/PreflightResults.h"
#include "framework/document/Selection.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/VantraController.h"
#include "framework/raster/DynamicBitmap.h"
#include "framework/raster/ICCProfile.h"
#include "framework/story/Story.h"

namespace Book
{

namespace
{

/// What a look at the pages of a document gives.
struct PageFacts
{
    std::vector<SpreadInfo> m_Spreads;
    /// The range of the pages that go into output, or of all if none does.
    String m_Pages;
    bool m_HasBleed = false;
    bool m_IsFacingPages = false;
    bool m_IsVerticalStack = false;
    bool m_HasSection = false;
    bool m_SectionIsDefault = false;
    int m_SectionStart = 0;
};

SpreadInfo ReadSpread(DocumentNode const & root, SpreadNode const & spread, int firstPage)
{
    SpreadInfo info;
    info.m_SpreadBounds = spread.GetSpreadBounds();
    info.m_SpreadExtents = spread.GetSpreadExtents(true, true, false);
    info.m_SpreadFlag = spread.HasTransparentBackground();
    for (int page = 0; page < spread.GetPageCount(); ++page) {
        auto const section = root.GetSectionFromPageNumber(static_cast<unsigned int>(firstPage + page));
        info.m_NonExporting.push_back(section && !section->GetIncludeOnExport());
        info.m_PageRects.push_back(spread.GetPageRect(page));
        info.m_PageBoxes.push_back(spread.GetPageBleed(page));
    }
    return info;
}

/// Under the document's reader lock.
PageFacts ReadPages(DocumentController const & document)
{
    DocumentNode const & root = *document.GetDocument();
    PageFacts facts;
    if (auto const section = root.GetSection(0)) {
        facts.m_HasSection = true;
        facts.m_SectionIsDefault = section->HasDefaultValues();
        facts.m_SectionStart = static_cast<int>(section->GetStartNumberingAt());
    }
    facts.m_HasBleed = root.HasBleed();
    facts.m_IsFacingPages = root.IsFacingPages();
    facts.m_IsVerticalStack = root.IsVerticalStack();

    int page = 0;
    int firstExporting = -1;
    int lastExporting = -1;
    for (int index = 0; index < root.GetSpreadCount(); ++index) {
        facts.m_Spreads.push_back(ReadSpread(root, *root.GetSpreadAtIndex(index), page));
        for (bool const nonExporting : facts.m_Spreads.back().m_NonExporting) {
            if (!nonExporting) {
                lastExporting = page;
                firstExporting = firstExporting < 0 ? page : firstExporting;
            }
            ++page;
        }
    }
    int const first = firstExporting < 0 ? 0 : firstExporting;
    int const last = lastExporting < 0 ? root.GetPageCount() - 1 : lastExporting;
    facts.m_Pages = root.GetFormattedPageNumber(static_cast<unsigned int>(first)) + " - " +
                    root.GetFormattedPageNumber(static_cast<unsigned int>(last));
    return facts;
}

String PreflightNotRun()
{
    return Kernel::LocalisedString("Preflight not run", "Chapter Status");
}

}

bool BookController::UpdateChapterStatus(Kernel::Counted<BookChapter const> chapter,
                                         Kernel::Counted<DocumentController const> document, bool updateTimeStamp,
                                         bool adoptStartPage)
{
    auto const mutableChapter = GetMutableChapter(std::move(chapter));
    return mutableChapter && UpdateChapterStatus(mutableChapter, std::move(document), updateTimeStamp, adoptStartPage);
}

bool BookController::UpdateChapterStatus(Kernel::Counted<BookChapter> chapter,
                                         Kernel::Counted<DocumentController const> document, bool updateTimeStamp,
                                         bool adoptStartPage)
{
    bool const wasGiven = static_cast<bool>(document);
    if (!wasGiven) {
        document = LoadChapterDocument(chapter, false, true);
    }
    if (!document) {
        if (chapter->SetPages(String())) {
            MarkChanged();
        }
        return false;
    }
    if (chapter->IsKey()) {
        if (auto const bitmap = document->GetDocumentCacheBitmap(0, false)) {
            m_Thumbnail.Set(bitmap);
        } else if (!m_Thumbnail.Get()) {
            m_Thumbnail.Set(RenderChapterThumbnail(document));
        }
    }

    int const index = IndexFromChapter(chapter);
    Kernel::Counted<BookChapter const> const previous = GetPreviousChapter(chapter);
    int const firstNote = previous ? previous->GetEndnoteSequenceEnd() : 1;
    int nextNote = firstNote;
    PageFacts pages;
    bool containsIndex = false;
    bool hasEndnotesMarker = false;
    Kernel::Counted<Story::Story const> endnotes;
    {
        // One stretch, so that an edit of a chapter in the user's hands comes before all of these facts or after them.
        DocumentControllerSession const session(document);
        pages = ReadPages(*document);
        containsIndex = IndexVisitor::ContainsIndex(document);
        hasEndnotesMarker = static_cast<bool>(BookEndnoteVisitor::FindCollatedBookEndnotes(document));
        InvestigateEndnotes(document, nextNote);
        endnotes = BookEndnoteVisitor::CollateBookEndnotesForChapter(document, index, !HasEndnotesBefore(chapter));
    }

    bool changed = false;
    {
        BookChapter::UpdateSession const session(*chapter);
        if (pages.m_HasSection) {
            // A later chapter whose first section nobody has touched goes on from the chapter before.
            if (adoptStartPage && !(pages.m_SectionIsDefault && index != 0)) {
                chapter->SetStartFromPage(pages.m_SectionStart);
            }
            chapter->SetCachedStartPage(pages.m_SectionStart);
        }
        chapter->SetHasBleed(pages.m_HasBleed);
        chapter->SetSpreadInfo(pages.m_Spreads);
        changed = chapter->SetPages(pages.m_Pages);
        chapter->SetIsFacingPages(pages.m_IsFacingPages);
        chapter->SetIsVerticalStack(pages.m_IsVerticalStack);
        chapter->SetUnitConverter(document->GetUnitConverter());
        chapter->SetProfiles(document->GetProfiles());
        chapter->SetProfile(document->GetProfile());
        chapter->SetColourFormat(document->GetFormat());
        chapter->SetUnitType(document->GetUnitType());
        chapter->SetMetadata(document->GetMetadata());
        chapter->SetContainsIndex(containsIndex);
        if (document->GetRestricted()) {
            chapter->SetRestricted(true);
        }
        chapter->SetHasEndnotesMarker(hasEndnotesMarker);
        chapter->SetEndnotes(endnotes, firstNote, nextNote);
    }
    UpdateChapterAnchors(chapter, document, nullptr);

    bool timeChanged = false;
    if (!wasGiven) {
        document = nullptr;
        ReleaseChapterDocument(chapter, updateTimeStamp);
    } else if (updateTimeStamp) {
        timeChanged = chapter->UpdateTimeStamp();
    }
    if (changed || timeChanged) {
        MarkChanged();
    }
    return timeChanged;
}

bool BookController::HasEndnotesBefore(Kernel::Counted<BookChapter const> const & chapter) const
{
    for (Kernel::Counted<BookChapter> const & earlier : Chapters()) {
        if (earlier && earlier == chapter) {
            return false;
        }
        auto const endnotes = earlier ? earlier->GetEndnotes() : nullptr;
        if (endnotes && !endnotes->Empty()) {
            return true;
        }
    }
    return false;
}

void BookController::UpdateForegroundChapterStatus()
{
    for (Kernel::Counted<BookChapter> const & chapter : Chapters()) {
        if (!chapter) {
            continue;
        }
        if (auto const document =
                VantraController::GetInstance().GetRegisteredDocumentControllerFromPath(chapter->GetPath())) {
            UpdateChapterStatus(chapter, document, false, false);
        }
    }
}

void BookController::UpdateForegroundChapterStatus() const
{
    AcquireReaderLock();
    const_cast<BookController *>(this)->UpdateForegroundChapterStatus();
    ReleaseReaderLock();
}

void BookController::UpdatePreflightStatus(Kernel::Counted<BookChapter const> chapter,
                                           Kernel::Counted<DocumentController const> document, bool run)
{
    if (auto const mutableChapter = GetMutableChapter(std::move(chapter))) {
        UpdatePreflightStatus(mutableChapter, std::move(document), run);
    }
}

void BookController::UpdatePreflightStatus(Kernel::Counted<BookChapter> chapter,
                                           Kernel::Counted<DocumentController const> document, bool run)
{
    bool const wasGiven = static_cast<bool>(document);
    if (!wasGiven) {
        document = LoadChapterDocument(chapter, true, false);
    }
    auto status = PreflightResult::Status::NotRun;
    String text = PreflightNotRun();
    Kernel::Counted<PreflightResults const> results;
    if (document) {
        if (run) {
            auto const check = Kernel::MakeCounted<PreflightCheckDocumentCommand>(PreflightForOperation::Check);
            // A key chapter that no pass has looked at yet tells nothing.
            if (Kernel::Counted<BookChapter const> const key = GetKeyChapter(true);
                key && !key->GetSpreadInfo().empty()) {
                check->ExpectFormat(key->GetColourFormat());
            }
            VantraController::GetInstance().EnqueueCommandAndWait(check, document, false);
        }
        results = document->GetPreflightResults();
        if (results) {
            PreflightResults::Summary const summary = results->GetSummary();
            status = summary.m_Status;
            text = summary.m_Text;
        }
        if (!wasGiven) {
            ReleaseChapterDocument(chapter, false);
        }
    }
    chapter->SetPreflightResults(results);
    if (chapter->SetPreflightStatus(status, text)) {
        MarkChanged();
    }
}

}
