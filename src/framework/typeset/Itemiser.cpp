#include "framework/typeset/Itemiser.h"

#include "framework/typeset/LineArena.h"

#include <unicode/ubidi.h>
#include <unicode/unorm2.h>
#include <unicode/uscript.h>
#include <unicode/utf16.h>

#include <algorithm>

namespace Typeset
{

namespace
{

bool IsWeakScript(std::uint8_t script) { return script == USCRIPT_COMMON || script == USCRIPT_INHERITED; }

/// The face can set the mark on the base: by a glyph of its own or by that of the composed character.
bool CanSetMark(FaceCoverage & coverage, char32_t base, char32_t mark)
{
    if (coverage.Has(mark)) {
        return true;
    }
    UErrorCode error = U_ZERO_ERROR;
    UNormalizer2 const * normaliser = unorm2_getNFCInstance(&error);
    UChar32 const composed =
        U_SUCCESS(error) ? unorm2_composePair(normaliser, static_cast<UChar32>(base), static_cast<UChar32>(mark)) : -1;
    return composed > 0 && coverage.Has(static_cast<char32_t>(composed));
}

}

Itemiser::Itemiser(WorkingText const & text, std::vector<ResolvedStyle *> const & styles, ShapeCache & cache,
                   std::vector<TextItem> & items, std::vector<LayoutProblem> & problems) :
    m_Work(text),
    m_Text(text.GetText()), m_Styles(styles), m_Cache(cache), m_Items(items), m_Problems(problems),
    m_FirstProblem(problems.size())
{
}

std::uint8_t Itemiser::FindLevels(Direction direction)
{
    bool const fixedLeft = direction != Direction::RightToLeft;
    if (fixedLeft && !(m_Work.GetFlags() & CharacterInfo::Bidi)) {
        return 0;
    }
    UBiDiLevel level = UBIDI_DEFAULT_LTR;
    if (direction == Direction::LeftToRight) {
        level = 0;
    } else if (direction == Direction::RightToLeft) {
        level = 1;
    }
    UErrorCode error = U_ZERO_ERROR;
    UBiDi * bidi = m_Cache.GetBidi();
    ubidi_setPara(bidi, m_Text.data(), static_cast<std::int32_t>(m_Text.size()), level, nullptr, &error);
    if (U_FAILURE(error) || m_Text.empty()) {
        return direction == Direction::RightToLeft ? 1 : 0;
    }
    m_Levels = ubidi_getLevels(bidi, &error);
    if (U_FAILURE(error)) {
        m_Levels = nullptr;
    }
    return ubidi_getParaLevel(bidi);
}

std::uint8_t Itemiser::Run(Direction direction)
{
    m_BaseLevel = FindLevels(direction);
    m_Script = USCRIPT_COMMON;
    // Weak characters at the start take the first strong script.
    for (std::size_t i = 0; i < m_Text.size() && IsWeakScript(m_Script);) {
        char32_t character = 0;
        U16_NEXT(m_Text.data(), i, m_Text.size(), character);
        m_Script = m_Cache.GetCharacters().Get(character).m_Script;
    }
    if (IsWeakScript(m_Script)) {
        m_Script = USCRIPT_LATIN;
    }
    std::size_t start = 0;
    for (WorkRun const & run : m_Work.GetRuns()) {
        CutRun(run, start, run.m_End);
        start = run.m_End;
    }
    return m_BaseLevel;
}

void Itemiser::CutRun(WorkRun const & run, std::size_t start, std::size_t end)
{
    // Single characters that are items by themselves, and changes of level, part the run.
    std::size_t stretch = start;
    auto const level = [this](std::size_t at) { return m_Levels ? m_Levels[at] : m_BaseLevel; };
    for (std::size_t i = start; i <= end; ++i) {
        bool const atEnd = i == end;
        char16_t const unit = atEnd ? u'\0' : m_Text[i];
        bool const isSingle = !atEnd && (unit == u'\t' || unit == WorkingText::LineSeparator || unit == u'\uFFFC');
        if (i > stretch && (atEnd || isSingle || (m_Levels && level(i) != level(stretch)))) {
            CutText(run, stretch, i, level(stretch));
            stretch = i;
        }
        if (isSingle) {
            TextItem item;
            item.m_Start = static_cast<std::uint32_t>(i);
            item.m_End = static_cast<std::uint32_t>(i + 1);
            item.m_Style = run.m_Style;
            item.m_Object = run.m_Object;
            item.m_Resolved = m_Styles[run.m_Style];
            item.m_Size = item.m_Resolved->GetStyle().m_Size;
            item.m_Level = unit == u'\uFFFC' ? level(i) : m_BaseLevel; // UAX #9 L1.
            item.m_Rise = unit == u'\uFFFC' ? item.m_Resolved->GetStyle().m_BaselineShift : 0;
            item.m_Kind = unit == u'\t'       ? TextItem::Kind::Tab
                          : unit == u'\uFFFC' ? TextItem::Kind::Box
                                              : TextItem::Kind::LineEnd;
            m_Items.push_back(item);
            stretch = i + 1;
        }
    }
}

void Itemiser::CutText(WorkRun const & run, std::size_t start, std::size_t end, std::uint8_t level)
{
    ResolvedStyle & style = *m_Styles[run.m_Style];
    if (style.GetFaces().empty()) {
        AppendText(run, start, end, level, StyleVariant::Plain, m_Script, nullptr);
        return;
    }
    CharacterTable & characters = m_Cache.GetCharacters();
    FaceCoverage & mainCoverage = m_Cache.GetCoverage(style.GetFaces().front());

    StyleVariant variant = run.m_ScaledCapitals ? StyleVariant::ScaledCapitals : StyleVariant::Plain;
    if (style.GetStyle().m_Position != ScriptPosition::Normal) {
        // All or nothing: superiors from the font beside scaled letters would look like a mistake.
        bool everyCharacter = true;
        for (std::size_t i = start; i < end && everyCharacter; ++i) {
            everyCharacter = m_Text[i] == u' ' || style.HasPositionGlyph(m_Text[i]);
        }
        variant = everyCharacter ? StyleVariant::PositionFeature : variant;
    }

    Kernel::Counted<FontFace const> const & mainFace = style.GetFaces().front();
    FontFace const * face = nullptr;
    Kernel::Counted<FontFace const> counted = mainFace;
    std::uint8_t script = m_Script;
    char32_t base = 0;
    std::size_t clusterStart = start;
    std::size_t itemStart = start;
    bool fallbackScript = false; // The last letter was one of a script that the main face lacks.
    for (std::size_t i = start; i < end;) {
        std::size_t const at = i;
        char32_t character = 0;
        U16_NEXT(m_Text.data(), i, end, character);
        CharacterInfo const & info = characters.Get(character);
        bool const continuesCluster = (info.m_Flags & CharacterInfo::Mark) && face;

        std::uint8_t newScript = script;
        if (!IsWeakScript(info.m_Script) && !continuesCluster) {
            newScript = info.m_Script;
        }
        FontFace const * newFace = face;
        std::size_t cut = at;
        if (continuesCluster) {
            if (!(info.m_Flags & CharacterInfo::Ignorable) && !CanSetMark(m_Cache.GetCoverage(counted), base, character)) {
                // Base and mark go together to a face that has both, if there is one.
                Kernel::Counted<FontFace const> const & other = style.FindFace(character);
                if (other && other->HasGlyph(base)) {
                    newFace = other.Get();
                    if (newFace != face) {
                        if (clusterStart > itemStart) {
                            AppendText(run, itemStart, clusterStart, level, variant, script, counted);
                        }
                        itemStart = clusterStart;
                        face = newFace;
                        counted = other;
                    }
                } else if (!other) {
                    ReportMissing(character, at, run.m_Style);
                }
            }
            continue;
        }
        base = character;
        clusterStart = at;
        bool const isWeak = IsWeakScript(info.m_Script);
        if (isWeak && fallbackScript && m_Cache.GetCoverage(counted).Has(character)) {
            newFace = face; // Spaces and punctuation among text in a fallback font come from that font.
        } else if (mainCoverage.Has(character)) {
            newFace = mainFace.Get();
        } else if (info.m_Flags & CharacterInfo::Ignorable) {
            newFace = face ? face : mainFace.Get();
        } else if (character == u'\u00A0' || (character >= 0x2000 && character <= 0x200A)) {
            newFace = face ? face : mainFace.Get(); // HarfBuzz makes these from the space.
        } else {
            Kernel::Counted<FontFace const> const & found = style.FindFace(character);
            newFace = found ? found.Get() : mainFace.Get();
            if (!found) {
                ReportMissing(character, at, run.m_Style);
            }
        }
        if (!isWeak) {
            fallbackScript = newFace != mainFace.Get();
        }
        bool const isFirst = !face;
        if (!isFirst && (newFace != face || newScript != script)) {
            AppendText(run, itemStart, cut, level, variant, script, counted);
            itemStart = cut;
        }
        if (newFace != face) {
            counted = Kernel::Counted<FontFace const>(newFace);
            face = newFace;
        }
        script = newScript;
        m_Script = newScript;
    }
    if (itemStart < end) {
        AppendText(run, itemStart, end, level, variant, script, counted);
    }
}

void Itemiser::AppendText(WorkRun const & run, std::size_t start, std::size_t end, std::uint8_t level,
                          StyleVariant variant, std::uint8_t script, Kernel::Counted<FontFace const> const & face)
{
    ResolvedStyle & style = *m_Styles[run.m_Style];
    TextItem item;
    item.m_Start = static_cast<std::uint32_t>(start);
    item.m_End = static_cast<std::uint32_t>(end);
    item.m_Style = run.m_Style;
    item.m_Object = run.m_Object;
    item.m_Resolved = &style;
    item.m_Level = level;
    item.m_Size = style.GetSize(variant);
    item.m_Rise = style.GetRise(variant);
    item.m_Tracking = style.GetTracking();
    item.m_Ideographic = script == USCRIPT_HAN || script == USCRIPT_HANGUL;
    if (face) {
        item.m_Context = &style.GetContext(face, variant, script, (level & 1) != 0);
        item.m_Scale = item.m_Size / face->GetUnitsPerEm();
    }
    m_Items.push_back(item);
}

void Itemiser::ReportMissing(char32_t character, std::size_t position, std::uint32_t style)
{
    for (std::size_t i = m_FirstProblem; i < m_Problems.size(); ++i) {
        if (m_Problems[i].m_Kind == LayoutProblem::Kind::MissingCharacter && m_Problems[i].m_Character == character) {
            return;
        }
    }
    m_Problems.push_back({LayoutProblem::Kind::MissingCharacter, m_Work.ToSource(position), style, character});
}

}
