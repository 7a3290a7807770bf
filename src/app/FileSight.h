#pragma once

#include <cstdint>
#include <string>

namespace App
{

/// What can be seen of a file from outside, without reading it: enough to know that a new look at its content is due.
struct FileSight
{
    /// Looks at the file. Opens it for a moment at most, and takes no lock that could stand in another program's way.
    [[nodiscard]] static FileSight Of(std::string const & path);

    bool m_Exists = false;
    bool m_CanBeRead = false;
    /// Another program holds it for itself.
    bool m_IsLocked = false;
    std::uint64_t m_Device = 0;
    std::uint64_t m_Inode = 0;
    std::int64_t m_Size = 0;
    /// Nanoseconds.
    std::int64_t m_Modified = 0;

    friend bool operator==(FileSight const &, FileSight const &) = default;
};

}
