// The plan of an export and sheets for a printer: arithmetic on chapter records.

#include "core/BookChapter.h"
#include "framework/document/AnchorInfo.h"
#include "framework/render/FileExportOptions.h"
#include "output/ExportBookCommand.h"
#include "output/PaginatorBooklet.h"

#include <benchmark/benchmark.h>
#include <fstream>
#include <malloc.h>

namespace
{

using Chapters = std::vector<Kernel::Counted<Book::BookChapter const>>;

/// A chapter of pages side by side, with anchors on them.
Kernel::Counted<Book::BookChapter const> MakeChapter(int number, int pages, int anchors)
{
    auto const chapter = Kernel::MakeCounted<Book::BookChapter>(String("/bench/" + std::to_string(number) + ".kvdoc"));
    std::vector<Book::SpreadInfo> spreads;
    for (int page = 0; page < pages; ++page) {
        if (page % 2 == 0) {
            spreads.emplace_back();
            spreads.back().m_SpreadBounds = {0, 0, 840, 595};
        }
        double const left = page % 2 * 420.0;
        spreads.back().m_PageRects.push_back({left, 0, left + 420, 595});
        spreads.back().m_PageBoxes.push_back({9, 9, 9, 9});
        spreads.back().m_NonExporting.push_back(false);
    }
    chapter->SetSpreadInfo(spreads);
    chapter->SetIsFacingPages(true);
    std::vector<AnchorInfo> infos(static_cast<std::size_t>(anchors));
    for (int anchor = 0; anchor < anchors; ++anchor) {
        infos[static_cast<std::size_t>(anchor)].m_Uid = std::to_string(number) + "-" + std::to_string(anchor);
        infos[static_cast<std::size_t>(anchor)].m_SpreadIndex = anchor * 7 % static_cast<int>(spreads.size());
    }
    chapter->SetAnchors(infos);
    return chapter;
}

Chapters MakeChapters(int count, int pages, int anchors)
{
    Chapters chapters;
    for (int number = 0; number < count; ++number) {
        chapters.push_back(MakeChapter(number, pages, anchors));
    }
    return chapters;
}

Kernel::Counted<Book::ExportBookCommand> MakePlan(Chapters const & chapters)
{
    auto const command = Kernel::MakeCounted<Book::ExportBookCommand>(
        chapters, String("/bench/out.pdf"),
        Kernel::Consolidated<Renderer::FileExportOptions>(Kernel::MakeCounted<Renderer::FileExportOptionsPDF const>()),
        Kernel::Size(), false, false, false, false, nullptr);
    command->SetStrayHandling(true, true);
    command->BuildExportMap();
    command->BuildPageMaps();
    return command;
}

/// 1,000 chapters of 100 pages: the map, the marks and the weights.
void Plan(benchmark::State & state)
{
    Chapters const chapters = MakeChapters(1000, 100, 0);
    std::size_t before = mallinfo2().uordblks;
    std::size_t grown = 0;
    for (auto _ : state) {
        before = mallinfo2().uordblks;
        auto const plan = MakePlan(chapters);
        std::vector<float> weights;
        plan->GetPagesPerStage(weights);
        benchmark::DoNotOptimize(weights.data());
        grown = mallinfo2().uordblks - before;
    }
    state.counters["MB"] = static_cast<double>(grown) / 1e6;
}

/// 10,000 anchors on that plan.
void Anchors(benchmark::State & state)
{
    Chapters const chapters = MakeChapters(1000, 100, 10);
    auto const plan = MakePlan(chapters);
    for (auto _ : state) {
        for (auto const & chapter : chapters) {
            plan->CollateAnchors(chapter);
        }
    }
}

/// A booklet of 10,000 pages, from the records to the sheets.
void Booklet(benchmark::State & state)
{
    Chapters const chapters = MakeChapters(100, 100, 0);
    std::vector<Book::PaginatorSource> all;
    for (auto const & chapter : chapters) {
        auto const spreads = chapter->GetSpreadInfo();
        for (std::size_t spread = 0; spread < spreads.size(); ++spread) {
            for (std::size_t page = 0; page < spreads[spread].m_PageRects.size(); ++page) {
                Book::PaginatorSource source;
                source.m_Chapter = chapter;
                source.m_Spread = static_cast<int>(spread);
                source.m_PageRect = spreads[spread].m_PageRects[page];
                source.m_PageBox = spreads[spread].m_PageBoxes[page];
                source.m_Index = static_cast<int>(all.size());
                all.push_back(source);
            }
        }
    }
    std::vector<int> chosen;
    for (Book::PaginatorSource const & source : all) {
        chosen.push_back(source.m_Index);
    }
    Book::PaginatorBooklet const booklet(false, false);
    for (auto _ : state) {
        benchmark::DoNotOptimize(booklet.Paginate({}, all, chosen, Renderer::FitTypeShrink, Renderer::OrientationAuto, 1,
                                                  false).size());
    }
}

BENCHMARK(Plan)->Unit(benchmark::kMillisecond);
BENCHMARK(Anchors)->Unit(benchmark::kMillisecond);
BENCHMARK(Booklet)->Unit(benchmark::kMillisecond);

}

BENCHMARK_MAIN();
