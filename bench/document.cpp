// What opening a chapter costs, as each pass over a book does it: load, the facts of its status, release.

#include "framework/document/AnchorVisitor.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentSettings.h"
#include "framework/kernel/FileSystem.h"
#include "framework/story/SpecialGlyphs.h"
#include "framework/story/StoryBuilder.h"

#include <benchmark/benchmark.h>

#include <cstdlib>

namespace
{

/// A chapter of some thirty pages with sixty headings and two hundred links.
String MakeChapter()
{
    String const path = Kernel::FileSystem::GetTemporaryFolder() + "/korvane-bench-chapter.kvdoc";
    DocumentSettings settings;
    settings.m_PageSetup.m_FirstMaster = "Body";
    settings.m_PageSetup.m_BodyMaster = "Body";
    MasterPageSettings page;
    page.m_TextRect = {50, 60, 370, 530};
    settings.m_Masters.push_back({"Body", page, page});
    settings.m_Metadata.m_Title = "Chapter";
    Story::StoryBuilder builder;
    auto const link = Story::HyperlinkData::ToWeb("https://example.org");
    for (int section = 0; section < 60; ++section) {
        builder.AppendObject(Kernel::MakeCounted<Story::AnchorGlyph>(Kernel::MakeCounted<Story::AnchorData>(
                                 "Section", true, true, "uid-" + std::to_string(section), 1)),
                             nullptr);
        builder.AppendText("Section", nullptr);
        builder.EndParagraph(nullptr);
        for (int paragraph = 0; paragraph < 3; ++paragraph) {
            builder.AppendText("See ", nullptr);
            builder.AppendText("there", Kernel::MakeCounted<Story::GlyphAtts>(Story::AttSet(), link));
            std::string text;
            for (int word = 0; word < 14; ++word) {
                text += " and the quick brown fox jumps over";
            }
            builder.AppendText(text + ".", nullptr);
            builder.EndParagraph(nullptr);
        }
    }
    Kernel::Counted<DocumentController> const document = DocumentController::CreateDocument(settings, builder.Finish());
    DocumentSaveResult result;
    document->SaveDocument(result, path);
    if (!result.IsSuccess()) {
        std::abort();
    }
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
