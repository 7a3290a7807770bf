#include "framework/typeset/ParagraphBuilder.h"

#include "framework/kernel/Assert.h"
#include "framework/typeset/BreakFinder.h"
#include "framework/typeset/BreakNodes.h"
#include "framework/typeset/Itemiser.h"
#include "framework/typeset/LineBreaker.h"
#include "framework/typeset/LineSetter.h"
#include "framework/typeset/Pieces.h"
#include "framework/typeset/ShapeCache.h"
#include "framework/typeset/WorkingText.h"

#include <algorithm>
#include <cmath>
#include <vector>

namespace Typeset
{

/// What a builder keeps between paragraphs, so that most of them allocate nothing.
struct ParagraphBuilder::Work
{
    std::unique_ptr<ShapeCache> m_Cache = ShapeCache::Borrow();
    std::vector<ResolvedStyle *> m_Styles;
    WorkingText m_Text;
    std::vector<TextItem> m_Items;
    std::vector<BreakPlace> m_Places;
    std::vector<BreakPlace> m_OtherPlaces;
    std::vector<std::uint32_t> m_AddressBreaks;
    std::vector<Piece> m_Pieces;
    std::vector<BreakNode> m_Nodes;
    std::vector<TabMark> m_Tabs;
    std::vector<std::uint32_t> m_Breaks;
    BumpArena m_Scratch;

    void ResolveStyles(ParagraphInput const & input);
    void FindPlaces(String const & language);
    void MergeSoftHyphens();
    void BreakAddresses();
    void RemoveTied();
};

namespace
{

// Longer paragraphs are broken line by line: weighing all their breaks against each other gains nothing.
constexpr std::size_t longestTotalFit = 200'000;
// Shorter ones are tried without hyphenation first; of longer ones, hardly any does without.
constexpr std::size_t longestWithoutHyphens = 400;
constexpr double widest = 1e7;

double Sane(double value, double least, double most)
{
    return std::isnan(value) ? least : std::clamp(value, least, most);
}

ParagraphSettings MakeSane(ParagraphSettings settings)
{
    settings.m_Width = Sane(settings.m_Width, 0, widest);
    for (LineRoom & room : settings.m_Rooms) {
        room.m_Left = Sane(room.m_Left, -widest, widest);
        room.m_Width = Sane(room.m_Width, 0, widest);
    }
    settings.m_StartIndent = Sane(settings.m_StartIndent, -widest, widest);
    settings.m_EndIndent = Sane(settings.m_EndIndent, -widest, widest);
    settings.m_FirstLineIndent = Sane(settings.m_FirstLineIndent, -widest, widest);
    settings.m_SpaceMinimum = Sane(settings.m_SpaceMinimum, 0, 1);
    settings.m_SpaceMaximum = Sane(settings.m_SpaceMaximum, 1, 100);
    settings.m_LetterSpaceMinimum = Sane(settings.m_LetterSpaceMinimum, -200, 0);
    settings.m_LetterSpaceMaximum = Sane(settings.m_LetterSpaceMaximum, 0, 1000);
    settings.m_Protrusion = Sane(settings.m_Protrusion, 0, 2);
    settings.m_HyphenPenalty = Sane(settings.m_HyphenPenalty, 0, 10000);
    settings.m_Tolerance = Sane(settings.m_Tolerance, 1, 10000);
    return settings;
}

}

ParagraphBuilder::ParagraphBuilder() : m_Work(std::make_unique<Work>()) {}

ParagraphBuilder::~ParagraphBuilder()
{
    m_Work->m_Scratch.Clear();
    ShapeCache::GiveBack(std::move(m_Work->m_Cache));
}

void ParagraphBuilder::DropCaches() { ShapeCache::DropIdle(); }

void ParagraphBuilder::Work::ResolveStyles(ParagraphInput const & input)
{
    // Of a table of styles that may be the whole document's, only those in use.
    m_Styles.assign(input.m_Styles.size(), nullptr);
    auto const resolve = [&](std::uint32_t style) {
        KORVANE_ASSERT_MESSAGE(style < m_Styles.size(), "a run names a style that is not in the table");
        if (!m_Styles[style]) {
            m_Styles[style] = &m_Cache->Resolve(input.m_Styles[style]);
        }
    };
    for (StyleRun const & run : input.m_Runs) {
        resolve(run.m_Style);
    }
    if (input.m_Runs.empty()) {
        resolve(0);
    }
}

void ParagraphBuilder::Work::FindPlaces(String const & language)
{
    m_Places.clear();
    BreakFinder::Find(m_Text.GetText(), m_Text.GetFlags(), language, *m_Cache, m_Places);
    if (!m_Text.GetSoftHyphens().empty()) {
        MergeSoftHyphens();
    }
    std::u16string_view const text = m_Text.GetText();
    if (text.find(u"://") != std::u16string_view::npos || text.find(u"www.") != std::u16string_view::npos) {
        BreakAddresses();
    }
    RemoveTied();
}

void ParagraphBuilder::Work::MergeSoftHyphens()
{
    m_OtherPlaces.clear();
    std::vector<std::uint32_t> const & hyphens = m_Text.GetSoftHyphens();
    std::uint32_t const length = static_cast<std::uint32_t>(m_Text.GetText().size());
    auto place = m_Places.begin();
    for (std::uint32_t const hyphen : hyphens) {
        while (place != m_Places.end() && place->m_Position < hyphen) {
            m_OtherPlaces.push_back(*place++);
        }
        bool const isPlace = place != m_Places.end() && place->m_Position == hyphen;
        bool const isDouble = !m_OtherPlaces.empty() && m_OtherPlaces.back().m_Position == hyphen;
        if (hyphen > 0 && hyphen < length && !isPlace && !isDouble) {
            m_OtherPlaces.push_back({hyphen, BreakPlace::Kind::SoftHyphen});
        }
    }
    m_OtherPlaces.insert(m_OtherPlaces.end(), place, m_Places.end());
    m_Places.swap(m_OtherPlaces);
}

void ParagraphBuilder::Work::BreakAddresses()
{
    std::u16string_view const text = m_Text.GetText();
    m_OtherPlaces.clear();
    auto place = m_Places.cbegin();
    for (Piece const & piece : m_Pieces) {
        std::u16string_view const stretch = text.substr(piece.m_Start, piece.m_End - piece.m_Start);
        while (place != m_Places.cend() && place->m_Position <= piece.m_Start) {
            m_OtherPlaces.push_back(*place++);
        }
        if (piece.m_Kind != Piece::Kind::Text || !IsWebAddress(stretch)) {
            continue;
        }
        while (place != m_Places.cend() && place->m_Position < piece.m_End) {
            ++place;
        }
        m_AddressBreaks.clear();
        FindAddressBreaks(stretch, m_AddressBreaks);
        for (std::uint32_t const at : m_AddressBreaks) {
            m_OtherPlaces.push_back({piece.m_Start + at, BreakPlace::Kind::Allowed});
        }
    }
    m_OtherPlaces.insert(m_OtherPlaces.end(), place, m_Places.cend());
    m_Places.swap(m_OtherPlaces);
}

void ParagraphBuilder::Work::RemoveTied()
{
    bool keepsTogether = false;
    for (ResolvedStyle const * style : m_Styles) {
        keepsTogether |= style && style->GetStyle().m_NoBreak;
    }
    std::vector<std::uint32_t> const & ties = m_Text.GetTies();
    if (ties.empty() && !keepsTogether) {
        return;
    }
    std::vector<WorkRun> const & runs = m_Text.GetRuns();
    auto tie = ties.begin();
    auto run = runs.begin();
    auto const isTied = [&](BreakPlace const & place) {
        if (place.m_Kind == BreakPlace::Kind::Mandatory) {
            return false;
        }
        while (tie != ties.end() && *tie < place.m_Position) {
            ++tie;
        }
        // The run of the code unit before the place.
        while (run != runs.end() && run->m_End < place.m_Position) {
            ++run;
        }
        bool const sameRun = run != runs.end() && place.m_Position < run->m_End;
        return (tie != ties.end() && *tie == place.m_Position) ||
               (sameRun && m_Styles[run->m_Style]->GetStyle().m_NoBreak);
    };
    std::erase_if(m_Places, isTied);
}

ParagraphLines ParagraphBuilder::Build(ParagraphInput const & input, LineArena & arena)
{
    KORVANE_ASSERT_MESSAGE(!input.m_Styles.empty(), "a paragraph needs a style");
    Work & work = *m_Work;
    work.m_Cache->Trim();
    work.m_Scratch.Clear();
    work.m_Items.clear();
    work.m_Pieces.clear();
    work.m_Styles.clear();
    ParagraphSettings const settings = MakeSane(input.m_Settings ? *input.m_Settings : ParagraphSettings());

    work.ResolveStyles(input);
    work.m_Text.Prepare(input, work.m_Styles, *work.m_Cache);
    std::vector<WorkRun> const & runs = work.m_Text.GetRuns();
    std::uint32_t lastStyle = 0xFFFFFFFF;
    for (WorkRun const & run : runs) {
        if (run.m_Style != lastStyle && !work.m_Styles[run.m_Style]->IsFamilyFound()) {
            arena.m_Problems.push_back({LayoutProblem::Kind::MissingFamily, 0, run.m_Style, 0});
        }
        lastStyle = run.m_Style;
    }

    Itemiser itemiser(work.m_Text, work.m_Styles, *work.m_Cache, work.m_Items, arena.m_Problems);
    std::uint8_t const baseLevel = itemiser.Run(settings.m_Direction);
    std::u16string_view const text = work.m_Text.GetText();
    PieceMaker maker(text, work.m_Items, work.m_Scratch);
    maker.Make(input.m_Objects, work.m_Pieces);
    work.FindPlaces(work.m_Styles[runs.front().m_Style]->GetStyle().m_Language);

    LineRooms const rooms(settings, (baseLevel & 1) != 0);
    NodeMaker nodes(text, work.m_Items, work.m_Pieces, maker, work.m_Cache->GetCharacters(), settings);
    // Where no line has any room, words stay whole.
    double const narrowest = rooms.GetNarrowest() > 0 ? rooms.GetNarrowest() : widest * 10;
    bool const hyphenates = settings.m_Hyphenate && settings.m_Mode != BreakMode::Code;
    bool const totalFit = settings.m_Mode == BreakMode::TotalFit && text.size() <= longestTotalFit;

    bool const triesWithout = hyphenates && totalFit && text.size() < longestWithoutHyphens;
    nodes.Make(work.m_Places, hyphenates && !triesWithout, narrowest, work.m_Nodes, work.m_Tabs);
    bool done = false;
    if (totalFit && work.m_Tabs.empty()) {
        LineBreaker breaker(work.m_Nodes, work.m_Tabs, rooms, settings);
        LineBreaker::Pass pass;
        if (triesWithout) {
            pass.m_Tolerance = std::min(100.0, settings.m_Tolerance);
            done = breaker.BreakTotalFit(pass, work.m_Breaks);
            if (!done) {
                nodes.Make(work.m_Places, true, narrowest, work.m_Nodes, work.m_Tabs);
            }
        }
        if (!done) {
            pass.m_Tolerance = settings.m_Tolerance;
            done = breaker.BreakTotalFit(pass, work.m_Breaks);
        }
        if (!done) {
            pass.m_Tolerance = std::max(settings.m_Tolerance, 1000.0);
            pass.m_Emergency = rooms.Get(rooms.GetFirstAlike()).m_Width * 0.02;
            done = breaker.BreakTotalFit(pass, work.m_Breaks);
        }
        for (bool const lastResorts : {false, true}) {
            if (done) {
                break;
            }
            pass.m_Tolerance = 1e9;
            pass.m_LastResorts = lastResorts;
            done = breaker.BreakTotalFit(pass, work.m_Breaks);
        }
    } else if (triesWithout) {
        nodes.Make(work.m_Places, true, narrowest, work.m_Nodes, work.m_Tabs);
    }

    LineSetter setter(input, settings, work.m_Text, work.m_Styles, work.m_Items, work.m_Pieces, work.m_Nodes, rooms,
                      maker, baseLevel, arena);
    if (!done) {
        LineBreaker breaker(work.m_Nodes, work.m_Tabs, rooms, settings);
        breaker.BreakGreedy(setter.GetSignWidth(), work.m_Breaks);
    }
    ParagraphLines lines;
    lines.m_FirstLine = static_cast<std::uint32_t>(arena.m_Lines.size());
    lines.m_RightToLeft = (baseLevel & 1) != 0;
    std::uint32_t from = 0;
    for (std::uint32_t const to : work.m_Breaks) {
        setter.Set(from, to);
        from = to;
    }
    lines.m_LineCount = static_cast<std::uint32_t>(arena.m_Lines.size()) - lines.m_FirstLine;
    return lines;
}

}
