#pragma once

#include "framework/typeset/ShapeCache.h"
#include "framework/typeset/WorkingText.h"

#include <cstdint>
#include <vector>

namespace Typeset
{

struct LayoutProblem;

/// A stretch of the working text of one style, face, script and direction; or one tab, box or line separator.
struct TextItem
{
    enum class Kind : std::uint8_t
    {
        Text,
        Tab,
        Box,
        LineEnd
    };
    std::uint32_t m_Start = 0;
    std::uint32_t m_End = 0;
    std::uint32_t m_Style = 0;
    std::uint32_t m_Object = 0xFFFFFFFF;
    ResolvedStyle * m_Resolved = nullptr;
    ShapingContext * m_Context = nullptr; ///< Null for other kinds than text, and on a machine without fonts.
    double m_Scale = 0;                   ///< Points to the font unit.
    double m_Size = 0;
    double m_Rise = 0;
    double m_Tracking = 0;
    std::uint8_t m_Level = 0;
    Kind m_Kind = Kind::Text;
    bool m_Ideographic = false; ///< Gaps between its clusters may be opened.
};

/// Cuts the working text into items: bidirectional levels (UAX #9, through ICU), scripts (UAX #24), faces with
/// fallback. Marks stay with their base. Returns the paragraph's base level.
class Itemiser
{
public:
    Itemiser(WorkingText const & text, std::vector<ResolvedStyle *> const & styles, ShapeCache & cache,
             std::vector<TextItem> & items, std::vector<LayoutProblem> & problems);

    std::uint8_t Run(Direction direction);

private:
    std::uint8_t FindLevels(Direction direction);
    void CutRun(WorkRun const & run, std::size_t start, std::size_t end);
    void CutText(WorkRun const & run, std::size_t start, std::size_t end, std::uint8_t level);
    void AppendText(WorkRun const & run, std::size_t start, std::size_t end, std::uint8_t level, StyleVariant variant,
                    std::uint8_t script, Kernel::Counted<FontFace const> const & face);
    void ReportMissing(char32_t character, std::size_t position, std::uint32_t style);

    WorkingText const & m_Work;
    std::u16string_view m_Text;
    std::vector<ResolvedStyle *> const & m_Styles;
    ShapeCache & m_Cache;
    std::vector<TextItem> & m_Items;
    std::vector<LayoutProblem> & m_Problems;
    std::size_t m_FirstProblem = 0;
    std::uint8_t const * m_Levels = nullptr; ///< Null: all are at the base level.
    std::uint8_t m_BaseLevel = 0;
    std::uint8_t m_Script = 0; ///< Of the last strong character.
};

}
