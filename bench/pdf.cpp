// Pages of prose into a PDF file that is thrown away: how fast, and how much memory a page costs.

#include "framework/kernel/MemoryStreams.h"
#include "framework/render/PdfExport.h"
#include "framework/typeset/FontLibrary.h"

#include <benchmark/benchmark.h>
#include <fstream>
#include <unistd.h>

namespace
{

using namespace Renderer;
using namespace Renderer::RenderTree;

/// Counts and forgets.
class NullStream : public Kernel::OutStream
{
public:
    void Write(void const *, std::size_t size) override { m_Position += size; }
    [[nodiscard]] std::uint64_t GetPosition() const override { return m_Position; }

private:
    std::uint64_t m_Position = 0;
};

/// A page of 36 justified lines of 60 letters, each page different.
DisplayList MakePage(Kernel::Counted<Typeset::FontFace const> const & face, unsigned number)
{
    static constexpr std::u16string_view letters = u"etaoin shrdlu cmfwyp vbgkjqxz, TAI. ";
    DisplayList list;
    unsigned random = number * 2654435761U + 1;
    for (int line = 0; line < 36; ++line) {
        std::u16string text;
        std::vector<Typeset::PlacedGlyph> glyphs(60);
        for (std::uint32_t i = 0; i < glyphs.size(); ++i) {
            random = random * 1664525U + 1013904223U;
            char16_t const letter = i % 6 == 5 ? u' ' : letters[(random >> 16) % letters.size()];
            text += letter;
            glyphs[i].m_Glyph = static_cast<std::uint16_t>(face->GetGlyph(letter));
            glyphs[i].m_Cluster = i;
            double const advance = face->GlyphAdvance(glyphs[i].m_Glyph) * 10.5 / face->GetUnitsPerEm();
            glyphs[i].m_Advance = static_cast<float>(letter == u' ' ? advance * 1.1371 : advance);
        }
        GlyphRun run;
        run.m_Face = face;
        run.m_Size = 10.5;
        run.m_Origin = {56.7, 60.0 + line * 14};
        list.DrawGlyphs(run, glyphs, text, 0);
    }
    return list;
}

long ResidentKilobytes()
{
    std::ifstream statm("/proc/self/statm");
    long total = 0;
    long resident = 0;
    statm >> total >> resident;
    return resident * (sysconf(_SC_PAGESIZE) / 1024);
}

void ProsePages(benchmark::State & state)
{
    auto const face = Typeset::FontLibrary::GetInstance().FromFile(
        "/usr/share/fonts/opentype/ebgaramond/EBGaramond12-Regular.otf", 0);
    if (!face) {
        state.SkipWithError("EB Garamond is not installed");
        return;
    }
    std::vector<DisplayList> pages;
    for (unsigned i = 0; i < 50; ++i) {
        pages.push_back(MakePage(face, i));
    }
    auto options = Kernel::MakeCounted<FileExportOptionsPDF>();
    FileExportOptionsPDF::Settings settings;
    settings.m_FixedTime = 0;
    options->SetSettings(settings);
    long const before = ResidentKilobytes();
    std::uint64_t size = 0;
    long after = before;
    for (auto _ : state) {
        auto const stream = Kernel::MakeCounted<NullStream>();
        PdfExport output(Kernel::MakeCounted<PdfSchema>(options, nullptr), nullptr);
        if (!output.Create("bench.pdf", stream, "", "Bench", "", "")) {
            state.SkipWithError(output.GetError().c_str());
            return;
        }
        std::vector<PdfHyperlink> links(static_cast<std::size_t>(state.range(1)));
        for (std::int64_t i = 0; i < state.range(0); ++i) {
            PdfPage page;
            page.m_Boxes = PageBoxes::Plain({0, 0, 420, 595});
            page.m_Label = std::to_string(i + 1);
            for (std::size_t link = 0; link < links.size(); ++link) {
                links[link].m_Page = static_cast<int>((i * 7 + 3) % state.range(0)) + 1;
                links[link].m_Position = {56, 100};
                links[link].m_Rect = {60, 60.0 + 14 * static_cast<double>(link), 80, 70.0 + 14 * static_cast<double>(link)};
            }
            if (!output.WritePage(page, pages[static_cast<std::size_t>(i) % pages.size()], links, nullptr)) {
                break;
            }
        }
        if (!output.Close()) {
            state.SkipWithError(output.GetError().c_str());
            return;
        }
        after = std::max(after, ResidentKilobytes());
        size = stream->GetPosition();
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
    state.counters["bytes/page"] = static_cast<double>(size) / static_cast<double>(state.range(0));
    state.counters["MB grown"] = static_cast<double>(after - before) / 1024;
}

// Pages and links a page.
BENCHMARK(ProsePages)->Args({10, 0})->Args({950, 0})->Args({950, 6})->Args({10000, 6})->Unit(benchmark::kMillisecond)
    ->MeasureProcessCPUTime()->UseRealTime();

}

BENCHMARK_MAIN();
