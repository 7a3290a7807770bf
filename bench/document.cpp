// What opening a chapter costs, as each pass over a book does it: load, the facts of its status, release.

#include "BenchChapter.h"

#include "framework/document/AnchorVisitor.h"
#include "framework/document/DocumentController.h"
#include "framework/kernel/FileSystem.h"

#include <benchmark/benchmark.h>

namespace
{

/// A chapter of some thirty pages with sixty headings and two hundred links.
String MakeChapter()
{
    String const path = Kernel::FileSystem::GetTemporaryFolder() + "/korvane-bench-chapter.kvdoc";
    WriteBenchChapter(path, BenchLinks::InEachParagraph);
    return path;
}

void BM_LoadAndAsk(benchmark::State & state)
{
    String const path = MakeChapter();
    int pages = 0;
    for (auto _ : state) {
        Kernel::Counted<DocumentController> const document = Kernel::MakeCounted<DocumentController>();
        OpenDocumentFailedNotification failure(path, false);
        if (!document->LoadDocument(path, false, false, LoadWhole, nullptr, failure, false)) {
            state.SkipWithError("the chapter can't be loaded");
            break;
        }
        DocumentNode const & node = *document->GetDocument();
        pages = node.GetPageCount();
        AnchorVisitor visitor(false);
        visitor.Visit(document->GetDocument());
        for (Kernel::Counted<AnchorInstance const> const & anchor : *visitor.GetAnchors()) {
            Kernel::Point point;
            benchmark::DoNotOptimize(anchor->GetSpreadAndTargetPoint(point));
        }
    }
    state.counters["pages"] = pages;
    Kernel::FileSystem::Delete(path, 0);
}
BENCHMARK(BM_LoadAndAsk)->Unit(benchmark::kMillisecond);

}

BENCHMARK_MAIN();
