// The plan of an export: what lands on which output page. Chapter records only; no document is opened.

#include "core/BookChapter.h"
#include "core/SpreadWalk.h"
#include "framework/document/AnchorInfo.h"
#include "framework/render/FileExportOptions.h"
#include "framework/render/PrintersMarks.h"
#include "output/ExportBookCommand.h"

#include <algorithm>

namespace Book
{

namespace
{

/// Page boxes that differ by less are the same.
constexpr double Tolerance = 0.005;

using Spreads = Snapshot<std::vector<SpreadInfo>>;

SpreadInfo const & At(Spreads const & spreads, int index)
{
    return spreads[static_cast<std::size_t>(index)];
}

int ExportingPages(SpreadInfo const & spread)
{
    return static_cast<int>(std::count(spread.m_NonExporting.begin(), spread.m_NonExporting.end(), false));
}

/// The size of a page along the direction in which a chapter's facing pages stack, the other coordinate zero.
Kernel::Size Step(BookChapter const & chapter, Kernel::Rect const & page, double sign)
{
    return chapter.IsVerticalStack() ? Kernel::Size{0, sign * page.Height()} : Kernel::Size{sign * page.Width(), 0};
}

Kernel::Rect MovedByStep(Kernel::Rect const & rect, BookChapter const & chapter, Kernel::Rect const & measure)
{
    Kernel::Size const step = Step(chapter, measure, 1);
    return rect.Moved(step.width, step.height);
}

/// Builds the entries chapter by chapter.
class MapBuilder
{
public:
    MapBuilder(std::vector<ExportPageEntry> & map, bool padStrays, bool mergeStrays)
        : m_Map(map), m_PadStrays(padStrays), m_MergeStrays(mergeStrays)
    {
    }

    void AddSinglePages(BookChapter const & chapter, int index)
    {
        Enter(chapter, index);
        for (; m_Place.m_Spread != -1; StepOn()) {
            // A later page of a spread is pulled back to the origin by its own size.
            m_Map.push_back({Ref(m_Place.m_Page == 0 ? Kernel::Size{} : Step(chapter, PageRect(m_Place.m_Page), -1))});
        }
    }

    void AddSpreads(Kernel::Counted<BookChapter const> const & chapter, int index)
    {
        Enter(*chapter, index);
        if (m_Previous && m_Previous->IsFacingPages() && !m_Map.empty() && m_Map.back().size() == 1) {
            CloseHangingPage(*chapter);
        }
        while (m_Place.m_Spread != -1) {
            m_Map.push_back(NextEntry(*chapter));
        }
        m_Previous = chapter;
    }

private:
    void Enter(BookChapter const & chapter, int index)
    {
        m_Index = index;
        m_Spreads = chapter.GetSpreadInfo();
        m_Place = SpreadWalk::FirstExporting(*m_Spreads);
    }

    void StepOn() { m_Place = SpreadWalk::NextExporting(*m_Spreads, m_Place); }

    /// The page at the present place.
    ExportPageRef Ref(Kernel::Size offset) const { return {m_Index, m_Place.m_Spread, m_Place.m_Page, offset}; }

    Kernel::Rect const & PageRect(int page) const
    {
        return At(m_Spreads, m_Place.m_Spread).m_PageRects[static_cast<std::size_t>(page)];
    }

    /// What becomes of the free place beside the previous chapter's last page.
    void CloseHangingPage(BookChapter const & chapter)
    {
        if (m_MergeStrays && chapter.CanMergeWithPrevious(m_Previous)) {
            m_Map.back().push_back(Ref(m_Place.m_Page != 0 ? Kernel::Size{} : Step(chapter, PageRect(0), 1)));
            StepOn();
        } else if (m_PadStrays) {
            m_Map.back().push_back({});
        }
    }

    bool LastEntryHoldsThisChapter() const
    {
        return !m_Map.empty() && std::any_of(m_Map.back().begin(), m_Map.back().end(), [&](ExportPageRef const & ref) {
            return ref.m_Chapter == m_Index;
        });
    }

    ExportPageEntry NextEntry(BookChapter const & chapter)
    {
        bool const isStray = ExportingPages(At(m_Spreads, m_Place.m_Spread)) == 1;
        bool const facing = chapter.IsFacingPages();
        ExportPageEntry entry;
        if (isStray && facing && m_Index != 0 && m_PadStrays) {
            if (LastEntryHoldsThisChapter() && m_Place.m_Page != 1) {
                entry = {Ref({}), {}};
            } else {
                entry = {{}, Ref(m_Place.m_Page != 0 ? Kernel::Size{} : Step(chapter, PageRect(0), 1))};
            }
            StepOn();
            return entry;
        }
        if (isStray && m_Place.m_Page == 1 && m_Index != 0) {
            // The lone right-hand page moves to the origin.
            entry = {Ref(Step(chapter, PageRect(1), -1))};
            StepOn();
            return entry;
        }
        int const spread = m_Place.m_Spread;
        entry.reserve(facing ? 2 : 1);
        entry.push_back(Ref({}));
        StepOn();
        if (facing && m_Place.m_Spread == spread) {
            entry.push_back(Ref({}));
            StepOn();
        }
        return entry;
    }

    std::vector<ExportPageEntry> & m_Map;
    bool m_PadStrays;
    bool m_MergeStrays;
    Kernel::Counted<BookChapter const> m_Previous;
    int m_Index = 0;
    Spreads m_Spreads;
    SpreadWalk::Place m_Place;
};

Kernel::Rect BoundsOfLastExportingSpread(BookChapter const & chapter)
{
    Spreads const spreads = chapter.GetSpreadInfo();
    return At(spreads, SpreadWalk::LastExporting(*spreads).m_Spread).m_SpreadBounds;
}

}

void ExportBookCommand::BuildExportMap()
{
    m_ExportMap.clear();
    MapBuilder builder(m_ExportMap, m_PadStrays, m_MergeStrays);
    for (std::size_t index = 0; index < m_Chapters.size(); ++index) {
        Kernel::Counted<BookChapter const> const & chapter = m_Chapters[index];
        if (chapter->GetPageCount() == 0) {
            continue; // Never opened, so it has no page to place.
        }
        if (m_SinglePages) {
            builder.AddSinglePages(*chapter, static_cast<int>(index));
        } else {
            builder.AddSpreads(chapter, static_cast<int>(index));
        }
    }
    IndexExportMap();
}

void ExportBookCommand::IndexExportMap()
{
    m_FirstEntries.assign(m_Chapters.size(), {});
    for (std::size_t page = 0; page < m_ExportMap.size(); ++page) {
        for (ExportPageRef const & ref : m_ExportMap[page]) {
            if (ref.IsPadding()) {
                continue;
            }
            std::vector<int> & spreads = m_FirstEntries[static_cast<std::size_t>(ref.m_Chapter)];
            std::size_t const spread = static_cast<std::size_t>(ref.m_Spread);
            if (spreads.size() <= spread) {
                spreads.resize(spread + 1, -1);
            }
            if (spreads[spread] == -1) {
                spreads[spread] = static_cast<int>(page);
            }
        }
    }
}

void ExportBookCommand::BuildPageMaps()
{
    m_PrintersMarks.clear();
    auto const options = Kernel::CountedCast<Renderer::FileExportOptionsPDF const>(m_Options.GetCounted());
    m_PrintersMarks.reserve(m_ExportMap.size());
    Kernel::Counted<BookChapter const> current;
    Spreads spreads;
    // Of the chapter before the current one; nothing before the first.
    Kernel::Rect before;
    for (ExportPageEntry const & entry : m_ExportMap) {
        if (IsAborted()) {
            return;
        }
        ExportPageRef const * const real = FirstReal(entry);
        if (!real) {
            continue;
        }
        Kernel::Counted<BookChapter const> const & chapter = m_Chapters[static_cast<std::size_t>(real->m_Chapter)];
        if (chapter != current) {
            before = current ? RoundedOutwards(BoundsOfLastExportingSpread(*current), Tolerance) : Kernel::Rect{};
            current = chapter;
            spreads = current->GetSpreadInfo();
        }
        SpreadInfo const & spread = At(spreads, real->m_Spread);
        Kernel::Rect const bounds = RoundedOutwards(spread.m_SpreadBounds, Tolerance);
        Kernel::Rect const & page = spread.m_PageRects[static_cast<std::size_t>(real->m_Page)];

        switch (FormOf(entry, static_cast<int>(spread.m_PageRects.size()))) {
        case ExportPageForm::WholeSpread:
            ProcessPageRect(bounds, current, options);
            break;
        case ExportPageForm::PageOfSpread:
            ProcessPageRect(page.IsEmpty() ? before : Kernel::Rect{0, 0, page.Width(), page.Height()}, current,
                            options);
            break;
        case ExportPageForm::Merged: {
            ExportPageRef const & last = entry.back();
            Spreads const lastSpreads = m_Chapters[static_cast<std::size_t>(last.m_Chapter)]->GetSpreadInfo();
            Kernel::Rect const & second =
                At(lastSpreads, last.m_Spread).m_PageRects[static_cast<std::size_t>(last.m_Page)];
            ProcessPageRect(MovedByStep(second, *current, page).United(page), current, options);
            break;
        }
        case ExportPageForm::PageThenPad:
            // United with the previous chapter's spread, not with this one's: imposed books were made so.
            ProcessPageRect(MovedByStep(bounds, *current, bounds).United(before), current, options);
            break;
        case ExportPageForm::PadThenPage:
            ProcessPageRect(spread.m_PageRects.size() > 1 ? bounds
                                                          : MovedByStep(bounds, *current, bounds).United(bounds),
                            current, options);
            break;
        case ExportPageForm::Nothing:
            break;
        }
    }
}

void ExportBookCommand::ProcessPageRect(Kernel::Rect const & rect, Kernel::Counted<BookChapter const> chapter,
                                        Kernel::Counted<Renderer::FileExportOptionsPDF const> options)
{
    if (!options) {
        return;
    }
    auto const marks = Kernel::MakeCounted<Renderer::PrintersMarksHelper>(rect, chapter->GetUnitConverter());
    marks->SetOptions(options->GetPrintersMarks());
    marks->SetFilename(m_Filename);
    marks->SetIsIncludeBleed(options->GetIncludeBleed());
    m_PrintersMarks.push_back(marks);
}

void ExportBookCommand::CollateAnchors(Kernel::Counted<BookChapter const> chapter)
{
    Snapshot<std::vector<AnchorInfo>> const anchors = chapter->GetAnchors();
    for (AnchorInfo const & anchor : anchors) {
        AnchorTarget target;
        target.m_Position = anchor.m_TargetPoint;
        target.m_Page = OutputPageFromSpreadPos(chapter, anchor.m_SpreadIndex, target.m_Position);
        m_AnchorTargets[anchor.m_Uid] = target;
    }
}

void ExportBookCommand::GetPagesPerStage(std::vector<float> & weights)
{
    int count = 0;
    int current = -1;
    Spreads spreads;
    for (ExportPageEntry const & entry : m_ExportMap) {
        ExportPageRef const * const real = FirstReal(entry);
        if (!real) {
            continue;
        }
        if (real->m_Chapter != current) {
            if (count > 0) {
                weights.push_back(static_cast<float>(count));
            }
            current = real->m_Chapter;
            count = 0;
            spreads = m_Chapters[static_cast<std::size_t>(current)]->GetSpreadInfo();
        }
        SpreadInfo const & spread = At(spreads, real->m_Spread);
        switch (FormOf(entry, static_cast<int>(spread.m_PageRects.size()))) {
        case ExportPageForm::WholeSpread:
        case ExportPageForm::PageOfSpread:
        case ExportPageForm::PageThenPad:
            ++count;
            break;
        case ExportPageForm::Merged:
        case ExportPageForm::PadThenPage:
            weights.push_back(static_cast<float>(count + 1));
            count = 0;
            break;
        case ExportPageForm::Nothing:
            break;
        }
    }
    if (count > 0) {
        weights.push_back(static_cast<float>(count));
    }
}

}
