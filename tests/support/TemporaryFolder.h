#pragma once

#include "framework/kernel/StringT.h"

#include <string>

/// A new folder for one test, removed with all that is in it when the object goes.
class TemporaryFolder
{
public:
    TemporaryFolder();
    ~TemporaryFolder();
    TemporaryFolder(TemporaryFolder const &) = delete;
    TemporaryFolder & operator=(TemporaryFolder const &) = delete;

    [[nodiscard]] String const & GetPath() const { return m_Path; }
    /// The path of a name in the folder.
    [[nodiscard]] String operator/(std::string_view name) const;
    /// Writes a file there, making folders as needed, and gives its path.
    String WriteFile(std::string_view name, std::string_view content) const;
    /// The bytes of a file there; fails the test if it can't be read.
    [[nodiscard]] std::string ReadFile(std::string_view name) const;

private:
    String m_Path;
};
