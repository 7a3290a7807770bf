#include "import/TableSize.h"

#include <algorithm>

namespace Import
{

namespace
{

/// The line without what may stand before a table that lies in quotations or lists.
std::string_view Bare(std::string_view line)
{
    std::size_t const begin = line.find_first_not_of(" \t>");
    std::size_t const end = line.find_last_not_of(" \t\r");
    return std::string_view::npos == begin || end < begin ? std::string_view() : line.substr(begin, end + 1 - begin);
}

bool IsRule(std::string_view bare)
{
    return std::string_view::npos == bare.find_first_not_of("|:- \t") && std::string_view::npos != bare.find('-') &&
           std::string_view::npos != bare.find('|');
}

/// Calls `visit(line)` for each line without its end.
template <typename TVisit>
void ForEachLine(std::string_view text, TVisit const & visit)
{
    while (!text.empty()) {
        std::size_t const end = std::min(text.find('\n'), text.size());
        visit(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
    }
}

}

std::vector<int> FindEndlessTables(std::string_view text)
{
    std::vector<int> rules;
    int number = 0;
    int rule = 0;
    std::size_t columns = 0;
    std::size_t rows = 0;
    auto const close = [&] {
        if (0 < rule && g_MostTableCells / columns < rows) {
            rules.push_back(rule);
        }
        rule = 0;
    };
    ForEachLine(text, [&](std::string_view line) {
        ++number;
        std::string_view const bare = Bare(line);
        if (bare.empty()) {
            close();
        } else if (0 == rule && IsRule(bare)) {
            rule = number;
            columns = static_cast<std::size_t>(std::count(bare.begin(), bare.end(), '|')) + 1;
            rows = 1;
        } else {
            ++rows;
        }
    });
    close();
    return rules;
}

std::string WithoutTables(std::string_view text, std::vector<int> const & rules)
{
    std::string result;
    result.reserve(text.size() + rules.size());
    int number = 0;
    auto rule = rules.begin();
    ForEachLine(text, [&](std::string_view line) {
        if (rules.end() != rule && ++number == *rule) {
            std::size_t const at = std::min(line.find_first_not_of(" \t>"), line.size());
            result.append(line.substr(0, at)).append("\\");
            line.remove_prefix(at);
            ++rule;
        }
        result.append(line).append("\n");
    });
    return result;
}

}
