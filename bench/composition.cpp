#include "framework/story/ByteStream.h"
#include "framework/story/FlowComposer.h"
#include "framework/story/NoteGlyphs.h"
#include "framework/story/StoryBuilder.h"
#include "framework/typeset/ParagraphBuilder.h"

#include <benchmark/benchmark.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <unordered_map>

/// Composition alone: a folder of prose (KORVANE_PROSE, by default the shared corpus) is read in the simplest way that
/// gives headings, quotations, notes and running text, and set on A5 pages on one thread.

namespace
{

using Kernel::Counted;
using Kernel::MakeCounted;
using namespace Story;

std::string ReadAll(std::filesystem::path const & path)
{
    std::ostringstream text;
    text << std::ifstream(path).rdbuf();
    return text.str();
}

/// Text of a paragraph: line ends become spaces, links their text, emphasis marks go.
std::string Plain(std::string_view text)
{
    std::string plain;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] == ']' && i + 1 < text.size() && text[i + 1] == '(') {
            i = std::min(text.find(')', i), text.size());
        } else if (text[i] == '[' && !(i + 1 < text.size() && text[i + 1] == '^')) {
            continue;
        } else if (text[i] != '*' && text[i] != '>') {
            plain += text[i] == '\n' ? ' ' : text[i];
        }
    }
    return plain;
}

Counted<::Story::Story> ReadChapter(std::filesystem::path const & path)
{
    std::vector<std::string> blocks;
    std::unordered_map<std::string, std::string> notes;
    std::string const all = ReadAll(path) + "\n\n";
    for (std::size_t begin = 0; begin < all.size();) {
        std::size_t const end = std::min(all.find("\n\n", begin), all.size());
        std::string block = all.substr(begin, end - begin);
        begin = end + 2;
        if (block.rfind("[^", 0) == 0) {
            std::size_t const colon = block.find("]:");
            notes[block.substr(2, colon - 2)] = block.substr(std::min(colon + 2, block.size()));
        } else if (block.find_first_not_of(" \n") != std::string::npos) {
            blocks.push_back(std::move(block));
        }
    }
    auto const body = ParagraphAtts::FromStyle("Body");
    StoryBuilder builder;
    for (std::string const & block : blocks) {
        std::string text = Plain(block);
        std::size_t const level = text.find_first_not_of('#');
        text.erase(0, std::min(level, text.size()));
        for (std::size_t place = 0; place < text.size();) {
            std::size_t const mark = std::min(text.find("[^", place), text.size());
            builder.AppendText(std::string_view(text).substr(place, mark - place), nullptr);
            std::size_t const close = std::min(text.find(']', mark), text.size());
            if (mark < text.size()) {
                StoryBuilder note;
                note.AppendText(Plain(notes[text.substr(mark + 2, close - mark - 2)]), nullptr);
                note.EndParagraph(ParagraphAtts::FromStyle("Note text"));
                builder.AppendObject(MakeCounted<PinnoteGlyph>(MakeCounted<NoteAtt const>(), note.Finish()), nullptr);
            }
            place = close + 1;
        }
        builder.EndParagraph(level > 0 ? ParagraphAtts::FromStyle("Heading") : body);
    }
    return builder.Finish();
}

std::vector<Counted<::Story::Story>> const & Chapters()
{
    static auto const chapters = [] {
        char const * named = std::getenv("KORVANE_PROSE");
        std::filesystem::path const folder = named ? named : "../shared/corpus/prose-variation";
        std::vector<Counted<::Story::Story>> list;
        if (std::filesystem::is_directory(folder)) {
            for (auto const & entry : std::filesystem::directory_iterator(folder)) {
                if (entry.path().extension() == ".md") {
                    list.push_back(ReadChapter(entry.path()));
                }
            }
        }
        return list;
    }();
    return chapters;
}

StyleSheet const & Styles()
{
    static auto const sheet = [] {
        auto styles = MakeCounted<StyleSheet>();
        AttSet glyphs;
        glyphs.SetString(GlyphAtt::Families, "EB Garamond");
        glyphs.SetString(GlyphAtt::Language, "en-GB");
        glyphs.SetDouble(GlyphAtt::Size, 10.5);
        AttSet paragraphs;
        paragraphs.SetDouble(ParagraphAtt::Leading, 13.5);
        styles->SetDefaults(glyphs, paragraphs);
        TextStyle body{"Body", "", {}, {}};
        body.m_ParagraphAtts.SetDouble(ParagraphAtt::FirstLineIndent, 13.5);
        styles->SetParagraphStyle(body);
        TextStyle heading{"Heading", "", {}, {}};
        heading.m_GlyphAtts.SetDouble(GlyphAtt::Size, 14);
        heading.m_ParagraphAtts.SetInt(ParagraphAtt::KeepWithNext, 1);
        heading.m_ParagraphAtts.SetInt(ParagraphAtt::OutlineLevel, 1);
        heading.m_ParagraphAtts.SetDouble(ParagraphAtt::SpaceBefore, 27);
        heading.m_ParagraphAtts.SetDouble(ParagraphAtt::SpaceAfter, 13.5);
        styles->SetParagraphStyle(heading);
        TextStyle note{"Note text", "", {}, {}};
        note.m_GlyphAtts.SetDouble(GlyphAtt::Size, 8.5);
        note.m_ParagraphAtts.SetDouble(ParagraphAtt::Leading, 10.8);
        note.m_ParagraphAtts.SetInt(ParagraphAtt::AlignToGrid, 0);
        styles->SetParagraphStyle(note);
        return styles;
    }();
    return *sheet;
}

FrameSource A5Frames()
{
    return [](std::uint32_t) { return FrameGeometry{306, 472.5, 13.5, 10}; };
}

std::size_t ComposeAll(FlowComposer & composer, std::vector<Counted<Layout>> & layouts)
{
    std::size_t pages = 0;
    layouts.clear();
    for (auto const & chapter : Chapters()) {
        layouts.push_back(composer.Compose(*chapter, Styles(), A5Frames(), {}));
        pages += layouts.back()->GetFrames().size();
    }
    return pages;
}

/// The argument says whether the cache of shaped words is emptied before each run.
void Compose(benchmark::State & state)
{
    bool const isCold = state.range(0) != 0;
    std::size_t pages = 0;
    std::vector<Counted<Layout>> layouts;
    FlowComposer composer;
    ComposeAll(composer, layouts);
    for (auto _ : state) {
        if (isCold) {
            Typeset::ParagraphBuilder::DropCaches();
        }
        pages += ComposeAll(composer, layouts);
    }
    state.counters["pages"] = static_cast<double>(pages) / static_cast<double>(state.iterations());
    state.counters["pages/s"] = benchmark::Counter(static_cast<double>(pages), benchmark::Counter::kIsRate);
}
BENCHMARK(Compose)->ArgName("cold")->Arg(1)->Arg(0)->Unit(benchmark::kMillisecond);

/// The longest chapter from bytes, as opening a document does it.
void LoadStory(benchmark::State & state)
{
    ::Story::Story const * longest = nullptr;
    for (auto const & chapter : Chapters()) {
        if (!longest || chapter->GetLength() > longest->GetLength()) {
            longest = chapter.Get();
        }
    }
    if (!longest) {
        state.SkipWithError("no prose");
        return;
    }
    ByteWriter out;
    longest->SaveBytes(out);
    for (auto _ : state) {
        ByteReader in(out.GetBytes());
        ::Story::Story story;
        benchmark::DoNotOptimize(story.LoadBytes(in));
    }
    state.counters["units"] = static_cast<double>(longest->GetLength());
}
BENCHMARK(LoadStory)->Unit(benchmark::kMicrosecond);

/// The longest layout: facts alone, and with the glyph data.
void LoadLayout(benchmark::State & state)
{
    std::vector<Counted<Layout>> layouts;
    FlowComposer composer;
    ComposeAll(composer, layouts);
    Layout const * longest = nullptr;
    for (auto const & layout : layouts) {
        if (!longest || layout->GetFrames().size() > longest->GetFrames().size()) {
            longest = layout.Get();
        }
    }
    if (!longest) {
        state.SkipWithError("no prose");
        return;
    }
    ByteWriter facts;
    ByteWriter glyphs;
    longest->SaveFacts(facts);
    longest->SaveGlyphData(glyphs);
    auto const block = std::make_shared<std::vector<std::byte>>(glyphs.TakeBytes());
    bool const withGlyphs = state.range(0) != 0;
    for (auto _ : state) {
        ByteReader in(facts.GetBytes());
        auto layout = Layout::LoadFacts(in);
        if (withGlyphs) {
            benchmark::DoNotOptimize(layout->LoadGlyphData(block, *block));
        }
    }
    state.counters["pages"] = static_cast<double>(longest->GetFrames().size());
    state.counters["fact bytes"] = static_cast<double>(facts.GetBytes().size());
    state.counters["glyph bytes"] = static_cast<double>(block->size());
}
BENCHMARK(LoadLayout)->ArgName("glyphs")->Arg(0)->Arg(1)->Unit(benchmark::kMicrosecond);

}

BENCHMARK_MAIN();
