#pragma once

#include <string>
#include <typeinfo>
#include <vector>

/// All command classes of the process by type and name: what a list of commands, a log or a coverage report is made from.
/// Filled by static objects before the program starts; safe on any thread.
class CommandCoverage
{
public:
    static CommandCoverage & Instance();

    /// The name as in the source, with its namespace. A second registration of a type changes nothing.
    void Register(std::type_info const & type, char const * name);
    /// Null for a class that is not registered.
    [[nodiscard]] char const * FindName(std::type_info const & type) const;
    /// In byte order.
    [[nodiscard]] std::vector<std::string> GetNames() const;

private:
    CommandCoverage() = default;
};
