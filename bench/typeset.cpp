#include "framework/typeset/Hyphenator.h"
#include "framework/typeset/ParagraphBuilder.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

/// Paragraphs alone: the prose of the corpus (KORVANE_PROSE names its folder), justified and hyphenated in the measure
/// of an A5 page, 2,300 characters being a page. Skipped where the corpus is not.

namespace
{

using namespace Typeset;

constexpr double charactersOfPage = 2300;

std::u16string Decode(std::string const & utf8)
{
    std::u16string text;
    for (std::size_t i = 0; i < utf8.size(); ++i) {
        auto const lead = static_cast<unsigned char>(utf8[i]);
        if (lead < 0x80) {
            text += static_cast<char16_t>(lead);
        } else if (lead < 0xE0 && i + 1 < utf8.size()) {
            text += static_cast<char16_t>((lead & 0x1F) << 6 | (utf8[i + 1] & 0x3F));
            ++i;
        } else if (lead < 0xF0 && i + 2 < utf8.size()) {
            text += static_cast<char16_t>((lead & 0x0F) << 12 | (utf8[i + 1] & 0x3F) << 6 | (utf8[i + 2] & 0x3F));
            i += 2;
        }
    }
    return text;
}

/// Paragraphs by chapter.
std::vector<std::vector<std::u16string>> const & Prose()
{
    static std::vector<std::vector<std::u16string>> const chapters = [] {
        std::vector<std::vector<std::u16string>> read;
        char const * own = std::getenv("KORVANE_PROSE");
        std::filesystem::path folder(own ? own : "../shared/corpus/prose-variation");
        std::error_code error;
        std::vector<std::filesystem::path> files;
        for (auto const & entry : std::filesystem::directory_iterator(folder, error)) {
            if (entry.path().extension() == ".md") {
                files.push_back(entry.path());
            }
        }
        std::sort(files.begin(), files.end());
        for (auto const & file : files) {
            std::ifstream stream(file);
            std::vector<std::u16string> & chapter = read.emplace_back();
            for (std::string line; std::getline(stream, line);) {
                if (!line.empty() && line.front() != '!' && line.front() != '#') {
                    chapter.push_back(Decode(line));
                }
            }
        }
        return read;
    }();
    return chapters;
}

Kernel::Counted<TextStyle const> MakeStyle(char const * family, bool italic)
{
    auto style = Kernel::MakeCounted<TextStyle>();
    style->m_Families = {family};
    style->m_Size = 10.5;
    style->m_Italic = italic;
    style->m_Language = "en";
    return style;
}

ParagraphSettings MakeSettings(BreakMode mode)
{
    ParagraphSettings settings;
    settings.m_Width = 310;
    settings.m_FirstLineIndent = 12;
    settings.m_Protrusion = 0.5;
    settings.m_Mode = mode;
    return settings;
}

std::size_t SetAll(Kernel::Counted<TextStyle const> const & style, ParagraphSettings const & settings, LineArena & arena)
{
    ParagraphBuilder builder;
    std::size_t characters = 0;
    for (auto const & chapter : Prose()) {
        arena.Clear();
        for (std::u16string const & text : chapter) {
            ParagraphInput input;
            input.m_Text = text;
            input.m_Styles = std::span(&style, 1);
            input.m_Settings = &settings;
            builder.Build(input, arena);
            characters += text.size();
        }
        benchmark::DoNotOptimize(arena.m_Glyphs.data());
    }
    return characters;
}

/// `cold` forgets all shaped words before each round: as in a process that builds a book once.
void Compose(benchmark::State & state, char const * family, bool italic, BreakMode mode, bool cold)
{
    if (Prose().empty()) {
        state.SkipWithError("no corpus: set KORVANE_PROSE");
        return;
    }
    Kernel::Counted<TextStyle const> const style = MakeStyle(family, italic);
    ParagraphSettings const settings = MakeSettings(mode);
    LineArena arena;
    std::size_t characters = SetAll(style, settings, arena);
    for (auto _ : state) {
        if (cold) {
            state.PauseTiming();
            ParagraphBuilder::DropCaches();
            state.ResumeTiming();
        }
        characters = SetAll(style, settings, arena);
    }
    state.counters["pages/s"] = benchmark::Counter(
        static_cast<double>(characters) / charactersOfPage, benchmark::Counter::kIsIterationInvariantRate);
}

BENCHMARK_CAPTURE(Compose, cold, "EB Garamond", false, BreakMode::TotalFit, true)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Compose, warm, "EB Garamond", false, BreakMode::TotalFit, false)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Compose, warm_greedy, "EB Garamond", false, BreakMode::Greedy, false)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Compose, kerned_spaces_warm, "Liberation Serif", false, BreakMode::TotalFit, false)
    ->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Compose, italic_warm, "EB Garamond", true, BreakMode::TotalFit, false)->Unit(benchmark::kMillisecond);

void LoadHyphenation(benchmark::State & state, char const * path)
{
    for (auto _ : state) {
        HyphenPatterns patterns;
        if (!patterns.Load(path)) {
            state.SkipWithError("no dictionary");
            return;
        }
    }
}
BENCHMARK_CAPTURE(LoadHyphenation, english, "/usr/share/hyphen/hyph_en_US.dic")->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(LoadHyphenation, german, "/usr/share/hyphen/hyph_de_DE.dic")->Unit(benchmark::kMillisecond);

}

BENCHMARK_MAIN();
