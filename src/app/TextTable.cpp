#include "app/TextTable.h"

#include "framework/kernel/Assert.h"

#include <algorithm>
#include <unicode/uchar.h>
#include <unicode/utf8.h>

namespace App
{

namespace
{

constexpr int g_Gap = 2;

int WidthOf(UChar32 c)
{
    if (c < 0) {
        return 1;
    }
    switch (u_charType(c)) {
    case U_NON_SPACING_MARK:
    case U_ENCLOSING_MARK:
    case U_FORMAT_CHAR:
    case U_CONTROL_CHAR:
        return 0;
    default:
        break;
    }
    int const width = u_getIntPropertyValue(c, UCHAR_EAST_ASIAN_WIDTH);
    return U_EA_WIDE == width || U_EA_FULLWIDTH == width ? 2 : 1;
}

/// Calls `visit(begin, end, width)` for each character; stops when that gives false.
template <typename TVisit>
void Walk(std::string_view text, TVisit const & visit)
{
    auto const length = static_cast<int32_t>(text.size());
    for (int32_t at = 0; at < length;) {
        int32_t const begin = at;
        UChar32 c = 0;
        U8_NEXT(text.data(), at, length, c);
        if (!visit(static_cast<std::size_t>(begin), static_cast<std::size_t>(at), WidthOf(c))) {
            return;
        }
    }
}

char const * CodeOf(CellLook look)
{
    switch (look) {
    case CellLook::Strong:
        return "\x1b[1m";
    case CellLook::Dim:
        return "\x1b[2m";
    case CellLook::Good:
        return "\x1b[32m";
    case CellLook::Warning:
        return "\x1b[33m";
    case CellLook::Bad:
        return "\x1b[31m";
    case CellLook::Plain:
        break;
    }
    return "";
}

}

std::string Harmless(std::string_view text)
{
    std::string result;
    auto const length = static_cast<std::int32_t>(text.size());
    for (std::int32_t at = 0; at < length;) {
        std::int32_t const begin = at;
        UChar32 c = 0;
        U8_NEXT(text.data(), at, length, c);
        bool const isControl = 0 <= c && U_CONTROL_CHAR == u_charType(c);
        result += isControl ? "?" : text.substr(static_cast<std::size_t>(begin), static_cast<std::size_t>(at - begin));
    }
    return result;
}

int DisplayWidth(std::string_view text)
{
    int width = 0;
    Walk(text, [&](std::size_t, std::size_t, int each) {
        width += each;
        return true;
    });
    return width;
}

std::string CutToWidth(std::string_view text, int width)
{
    if (DisplayWidth(text) <= width) {
        return std::string(text);
    }
    std::size_t kept = 0;
    int used = 0;
    Walk(text, [&](std::size_t, std::size_t end, int each) {
        if (width - 1 < used + each) {
            return false;
        }
        used += each;
        kept = end;
        return true;
    });
    return width < 1 ? std::string() : std::string(text.substr(0, kept)) + "\u2026";
}

void TextTable::AddRow(std::vector<TableCell> cells)
{
    KORVANE_ASSERT(cells.size() == m_Columns.size());
    for (TableCell & cell : cells) {
        cell.m_Text = Harmless(cell.m_Text);
    }
    m_Rows.push_back(std::move(cells));
}

std::vector<int> TextTable::Widths(int columns) const
{
    std::vector<int> widths;
    int total = -g_Gap;
    for (std::size_t at = 0; at < m_Columns.size(); ++at) {
        int width = 0;
        for (auto const & row : m_Rows) {
            width = std::max(width, DisplayWidth(row[at].m_Text));
        }
        width = 0 == width ? 0 : std::max(width, DisplayWidth(m_Columns[at].m_Title));
        widths.push_back(width);
        total += 0 == width ? 0 : width + g_Gap;
    }
    for (std::size_t at = m_Columns.size(); 0 < columns && 0 < at-- && columns < total;) {
        if (m_Columns[at].m_IsFlexible && g_LeastWidth < widths[at]) {
            int const less = std::min(total - columns, widths[at] - g_LeastWidth);
            widths[at] -= less;
            total -= less;
        }
    }
    return widths;
}

std::vector<std::string> TextTable::Layout(int columns, bool hasColour) const
{
    std::vector<int> const widths = Widths(columns);
    std::vector<TableCell> titles;
    for (TableColumn const & column : m_Columns) {
        titles.push_back({column.m_Title, CellLook::Strong});
    }
    std::vector<std::string> lines;
    auto const add = [&](std::vector<TableCell> const & cells) {
        std::string line;
        int pending = 0;
        int used = 0;
        for (std::size_t at = 0; at < cells.size(); ++at) {
            if (0 == widths[at]) {
                continue;
            }
            int const room = 0 < columns ? std::min(widths[at], columns - used) : widths[at];
            if (room <= 0) {
                break;
            }
            std::string const text = CutToWidth(cells[at].m_Text, room);
            int const padding = room - DisplayWidth(text);
            pending += m_Columns[at].m_IsRightAligned ? padding : 0;
            if (!text.empty()) {
                std::string const code = hasColour ? CodeOf(cells[at].m_Look) : "";
                line.append(static_cast<std::size_t>(pending), ' ');
                line += code + text + (code.empty() ? "" : "\x1b[0m");
                pending = 0;
            }
            pending += (m_Columns[at].m_IsRightAligned ? 0 : padding) + g_Gap;
            used += widths[at] + g_Gap;
        }
        lines.push_back(std::move(line));
    };
    if (!m_Rows.empty()) {
        add(titles);
    }
    for (auto const & row : m_Rows) {
        add(row);
    }
    return lines;
}

}
