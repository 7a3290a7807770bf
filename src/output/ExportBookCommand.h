#pragma once

#include "commands/BookCommand.h"
#include "framework/document/ExportResult.h"
#include "framework/kernel/Abortable.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/Geometry.h"
#include "framework/kernel/Progress.h"
#include "framework/render/Warning.h"
#include "output/ExportPageRef.h"

#include <map>
#include <vector>

class DocumentController;
class ExportableInterface;
class SpreadNode;

namespace Kernel
{
class SequenceProgressReporter;
}
namespace Raster
{
class DynamicBitmap;
class ICCProfile;
}
namespace Renderer
{
class FileExportOptions;
class FileExportOptionsPDF;
struct PdfBookmark;
class PrintersMarksHelper;
}

namespace Book
{

class BookChapter;
class ExportPdfWalk;

/// Turns a list of chapters into output files.
///
/// First it plans, from the chapter records alone and with no document open: which pages land on which output page,
/// where padding goes, how stray pages of neighbouring chapters are put together, where the printer's marks sit, where
/// every anchor ends up and how the progress bar is divided. Then it writes one PDF for all chapters.
///
/// Only PDF is written; with options of another format the export fails without a cause.
///
/// It runs on the book's queue with the book lock engaged, and is used once. The caller brings the book up to date first
/// (`BookCollection::PreOutput`) and passes only valid chapters. All chapter indices here count in the list that was
/// passed, not in the book. Output pages are numbered from 1. The abort flag is polled throughout; once it is set the
/// target is left alone.
class ExportBookCommand : public BookCommand, public Kernel::Abortable
{
    KORVANE_BOOK_COMMAND(ExportBookCommand);

public:
    /// Where an anchor landed.
    struct AnchorTarget
    {
        int m_Page = -1;           ///< Output page, -1 if it isn't exported.
        Kernel::Point m_Position{}; ///< On that output page.
    };

    /// `size` (pixels for the key chapter's first spread) and the two spreads flags are for formats that make one file an
    /// output page; PDF has no use for them. `isTemp` marks a
    /// throw-away export for a preview: it keeps progress out of sight, reports to `progress`, and tells of no failure.
    /// `singlePages` exports page by page rather than spread by spread.
    ExportBookCommand(std::vector<Kernel::Counted<BookChapter const>> chapters, String filename,
                      Kernel::Consolidated<Renderer::FileExportOptions> options, Kernel::Size size, bool isTemp,
                      bool spreadsFlagA, bool spreadsFlagB, bool singlePages, Kernel::Counted<Kernel::Progress> progress);
    ~ExportBookCommand() override;

    Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    /// One notification with a record for each file; none if the run stopped before the writer.
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;
    ProgressType GetProgressType() override;
    bool * GetProgressAbortPointer() const override;

    // The plan. Each step reads only chapter records, so who wants nothing but the plan can take these steps anywhere.
    /// What becomes of single pages where two chapters meet: blanks, or sharing a spread. `Do` takes it from the book.
    void SetStrayHandling(bool pad, bool merge);
    void BuildExportMap();
    void BuildPageMaps();
    void CollateAnchors(Kernel::Counted<BookChapter const> chapter);
    /// One weight for each run of a writer: the number of its output pages.
    void GetPagesPerStage(std::vector<float> & weights);
    /// Appends one entry of printer's marks round `rect`; nothing without PDF options.
    void ProcessPageRect(Kernel::Rect const & rect, Kernel::Counted<BookChapter const> chapter,
                         Kernel::Counted<Renderer::FileExportOptionsPDF const> options);

    [[nodiscard]] std::vector<ExportPageEntry> const & GetExportMap() const { return m_ExportMap; }

    // What the notification does not say, for who waited for the command's end.
    /// Why it failed, in one sentence with the file that it is about; empty where nothing more is known than the result.
    [[nodiscard]] String const & GetError() const { return m_Error; }
    /// What came out other than asked, page by page in the order of output.
    [[nodiscard]] std::vector<Renderer::RenderTree::Warning> const & GetWarnings() const { return m_Warnings; }

    // Look-ups on the complete plan.
    /// Index in the exported chapters, -1 if it isn't one of them.
    [[nodiscard]] int IndexFromChapter(Kernel::Counted<BookChapter const> chapter) const;
    /// Zero-based number of the first output page with a page of that chapter, -1 if none.
    [[nodiscard]] int GetChapterOffset(int chapterIndex) const;
    /// Offset of that chapter's first page; zero if none.
    [[nodiscard]] Kernel::Size GetChapterFirstPageOffset(int chapterIndex) const;
    [[nodiscard]] AnchorTarget * GetAnchorTarget(String const & uid);
    /// Marks of an output page, null if out of range. Entries without output have none, so that this list can be
    /// shorter than the map.
    [[nodiscard]] Kernel::Counted<Renderer::PrintersMarksHelper> GetPrintersMarksForTarget(int page) const;
    /// Output page of the book's collated endnotes, -1 if there are none.
    [[nodiscard]] int PageForEndnotes() const { return m_EndnotesPage; }

    /// Output page of a place, -1 if it isn't exported. All of these stop at the first page in the map that matches in
    /// chapter and spread, whatever its index in the spread. `position` and `rect` are moved to the output page.
    int OutputPageFromSpreadPos(Kernel::Counted<BookChapter const> chapter, int spread, Kernel::Point & position) const;
    int OutputPageFromSpreadRect(Kernel::Counted<DocumentController const> document,
                                 Kernel::JailCounted<SpreadNode> spread, Kernel::Rect & rect);
    int OutputPageFromPageIndex(Kernel::Counted<DocumentController const> document, int pageIndex);
    int OutputPageFromSectionIndex(Kernel::Counted<DocumentController const> document, int sectionIndex);
    /// `bookChapterIndex` counts in the book.
    int OutputPageFromChapterPage(int bookChapterIndex, int pageInChapter);

protected:
    ExportBookCommand();

    /// Puts the XMP metadata of the key chapter into the finished file at `path`, in place of what it has. Success without
    /// doing anything if the options don't ask for metadata.
    ExportResult EmbedMetadata(Kernel::Consolidated<Renderer::FileExportOptions> const & options, String const & path);

private:
    friend class ExportPdfWalk;

    ExportResult ExportPDF(Kernel::Counted<Kernel::SequenceProgressReporter> reporter);
    /// Finishes the temporary file: metadata, then the copy over the target.
    ExportResult DeliverToTarget(String const & temporaryPath);
    /// The page on which the collated endnotes start.
    void FindEndnotesPage(ExportPdfWalk & walk);
    /// The chapter's root bookmark and the document's own bookmarks below it.
    void CollatePDFBookmarksForChapter(Kernel::Counted<BookChapter const> chapter,
                                       Kernel::Counted<DocumentController const> document);

    /// Fills `m_FirstEntries` from the map.
    void IndexExportMap();
    /// First ref of a chapter's spread, with its 1-based output page; page -1 if there is none.
    std::pair<int, ExportPageRef const *> FindSpread(int chapterIndex, int spread) const;

    std::vector<Renderer::RenderTree::Warning> m_Warnings;
    std::vector<Kernel::Counted<BookChapter const>> m_Chapters;
    Kernel::Consolidated<Renderer::FileExportOptions> m_Options;
    String m_Filename;
    bool m_IsTemp = false;
    Kernel::Counted<Kernel::Progress> m_Progress;
    std::map<String, AnchorTarget> m_AnchorTargets;
    std::vector<ExportPageEntry> m_ExportMap;
    /// For each chapter and spread the first entry of the map that holds it, -1 for none: every link and anchor asks.
    std::vector<std::vector<int>> m_FirstEntries;
    std::vector<Kernel::Counted<Renderer::PrintersMarksHelper>> m_PrintersMarks;
    std::vector<Kernel::Counted<Renderer::PdfBookmark const>> m_Bookmarks;
    std::vector<String> m_OutputPaths;
    std::vector<ExportResult> m_Results;
    String m_Error;
    Kernel::Counted<Raster::DynamicBitmap> m_PreviewBitmap;
    Kernel::Consolidated<Raster::ICCProfile> m_PreviewProfile;
    bool m_PadStrays = false;
    bool m_MergeStrays = false;
    int m_EndnotesPage = -1;
    bool m_SinglePages = false;
};

}
