// What the preview of a book file costs: rendering an A4 spread, and the PNG that a save makes of the bitmap.

#include "framework/document/DocumentSettings.h"
#include "framework/document/SpreadPreview.h"
#include "framework/story/StoryBuilder.h"

#include <benchmark/benchmark.h>

#include <cstdlib>

namespace
{

/// A page full of text.
Kernel::Counted<DocumentController> MakeDocument(Raster::Format format)
{
    DocumentSettings settings;
    settings.m_Format = format;
    settings.m_PageSetup.m_PageSize = {595.276, 841.89};
    settings.m_PageSetup.m_FirstMaster = "Body";
    settings.m_PageSetup.m_BodyMaster = "Body";
    MasterPageSettings page;
    page.m_TextRect = {60, 60, 535, 780};
    settings.m_Masters.push_back({"Body", page, page});
    Story::StoryBuilder builder;
    for (int paragraph = 0; paragraph < 20; ++paragraph) {
        std::string text = "See";
        for (int word = 0; word < 20; ++word) {
            text += " and the quick brown fox jumps over";
        }
        builder.AppendText(text + ".", nullptr);
        builder.EndParagraph(nullptr);
    }
    return DocumentController::CreateDocument(settings, builder.Finish());
}

void BM_RenderA4(benchmark::State & state)
{
    auto const document = MakeDocument(static_cast<Raster::Format>(state.range(0)));
    for (auto _ : state) {
        auto const bitmap = SpreadPreview::Render(document, 0);
        if (!bitmap || bitmap->GetHeight() != 841) {
            std::abort();
        }
    }
}

void BM_PngFromA4(benchmark::State & state)
{
    auto const document = MakeDocument(static_cast<Raster::Format>(state.range(0)));
    auto const bitmap = SpreadPreview::Render(document, 0);
    std::size_t size = 0;
    for (auto _ : state) {
        auto const png = SpreadPreview::Encode(*bitmap, 595.276, 841.89, false, document->GetProfile(),
                                               document->GetProfiles());
        size = png->GetSize();
    }
    state.counters["bytes"] = static_cast<double>(size);
}

}

// Red, green and blue; CMYK; Lab.
BENCHMARK(BM_RenderA4)->Unit(benchmark::kMillisecond)->Arg(0)->Arg(4)->Arg(5);
BENCHMARK(BM_PngFromA4)->Unit(benchmark::kMillisecond)->Arg(0)->Arg(4)->Arg(5);
BENCHMARK_MAIN();
