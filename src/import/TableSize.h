#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace Import
{

/// Most cells of one table that are set; a table of this size takes some 600 MB while its pages are made.
constexpr std::size_t g_MostTableCells = 250'000;

/// Rows of a table are filled up to the width of its head, so a file of a few kilobytes can ask for billions of cells.
/// Gives the lines (from 1) of the heads' rules of tables that would have more than `g_MostTableCells`, by an estimate from
/// above. Linear in the text.
std::vector<int> FindEndlessTables(std::string_view text);

/// The text with a backslash before each of these rules, which makes plain paragraphs of the tables.
std::string WithoutTables(std::string_view text, std::vector<int> const & rules);

}
