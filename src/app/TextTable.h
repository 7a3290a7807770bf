#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace App
{

/// Columns that a text takes on a terminal: none for combining marks, two for wide characters of East Asian scripts and
/// for pictograms (UAX #11). The text is UTF-8; bytes that are not count one each.
[[nodiscard]] int DisplayWidth(std::string_view text);

/// The text with "?" in place of what a terminal would obey and of line ends: file names may hold anything.
[[nodiscard]] std::string Harmless(std::string_view text);

/// The text cut to `width` columns, with an ellipsis in place of what is gone. A mark stays with its letter.
[[nodiscard]] std::string CutToWidth(std::string_view text, int width);

/// What a cell looks like where there are colours.
enum class CellLook
{
    Plain,
    Strong,
    Dim,
    Good,
    Warning,
    Bad
};

struct TableCell
{
    std::string m_Text;
    CellLook m_Look = CellLook::Plain;
};

struct TableColumn
{
    std::string m_Title;
    /// Gives way when the terminal is narrow: first the last such column, then those before it.
    bool m_IsFlexible = false;
    bool m_IsRightAligned = false;
};

/// A table for people, laid out in columns that fit its content and the terminal.
class TextTable
{
public:
    explicit TextTable(std::vector<TableColumn> columns) : m_Columns(std::move(columns)) {}

    /// As many cells as there are columns.
    void AddRow(std::vector<TableCell> cells);

    /// The lines, the titles first, none longer than `columns` if that is not 0. Columns without any text are left out.
    /// A flexible column keeps at least `g_LeastWidth` columns; if that is too much, the lines are cut.
    [[nodiscard]] std::vector<std::string> Layout(int columns, bool hasColour) const;

    static constexpr int g_LeastWidth = 8;

private:
    [[nodiscard]] std::vector<int> Widths(int columns) const;

    std::vector<TableColumn> m_Columns;
    std::vector<std::vector<TableCell>> m_Rows;
};

}
