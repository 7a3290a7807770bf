#include "framework/kernel/CommandCoverage.h"

#include <algorithm>
#include <map>
#include <mutex>
#include <typeindex>

namespace
{

struct Coverage
{
    std::mutex m_Lock;
    std::map<std::type_index, char const *> m_Names;
};

/// Built at the first registration, whichever source unit that is in.
Coverage & GetCoverage()
{
    static Coverage * const coverage = new Coverage;
    return *coverage;
}

}

CommandCoverage & CommandCoverage::Instance()
{
    static CommandCoverage instance;
    return instance;
}

void CommandCoverage::Register(std::type_info const & type, char const * name)
{
    Coverage & coverage = GetCoverage();
    std::lock_guard const lock(coverage.m_Lock);
    coverage.m_Names.emplace(type, name);
}

char const * CommandCoverage::FindName(std::type_info const & type) const
{
    Coverage & coverage = GetCoverage();
    std::lock_guard const lock(coverage.m_Lock);
    auto const found = coverage.m_Names.find(type);
    return found == coverage.m_Names.end() ? nullptr : found->second;
}

std::vector<std::string> CommandCoverage::GetNames() const
{
    Coverage & coverage = GetCoverage();
    std::vector<std::string> names;
    {
        std::lock_guard const lock(coverage.m_Lock);
        for (auto const & [type, name] : coverage.m_Names) {
            names.emplace_back(name);
        }
    }
    std::sort(names.begin(), names.end());
    return names;
}
