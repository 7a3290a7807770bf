#pragma once

#include "framework/kernel/StringT.h"
#include "framework/kernel/TimeStamp.h"

#include <cstdint>
#include <vector>

namespace Kernel
{

/// Questions and operations on files and folders by path. Safe on any thread. No operation throws: they say whether
/// they worked, and `errno` then tells why not.
class FileSystem
{
public:
    /// What `CopyFile` and `Rename` do with a target that exists.
    enum class IfExists
    {
        Fail,
        Replace,
    };

    /// Which file an open file or a path is: two names of one file have the same identity.
    struct Identity
    {
        std::uint64_t m_Device = 0;
        std::uint64_t m_Inode = 0;
        friend bool operator==(Identity const &, Identity const &) = default;
    };

    /// A file or folder of this name can be found. Links are followed.
    [[nodiscard]] static bool Exists(String const & path);
    [[nodiscard]] static bool IsFolder(String const & path);
    /// The modification time; false, and `time` as it was, if the file cannot be asked.
    static bool GetModifiedTime(String const & path, TimeStamp & time);
    static bool SetModifiedTime(String const & path, TimeStamp time);
    static bool GetSize(String const & path, std::uint64_t & size);
    static bool GetIdentity(String const & path, Identity & identity);
    static bool GetIdentity(int fileDescriptor, Identity & identity);

    /// Removes a file, or an empty folder. `flags` 0; with `DeleteReadOnly` also where the file's own mark forbids
    /// writing.
    static bool Delete(String const & path, unsigned int flags);
    static constexpr unsigned int DeleteReadOnly = 1;
    /// Removes a folder with all that it holds. Links are removed, not followed.
    static bool DeleteFolder(String const & path);

    /// Copies content and permissions to a file that must not exist yet. On failure no part of the copy stays.
    static bool CopyFile(String const & from, String const & to);
    static bool CopyFile(String const & from, String const & to, IfExists ifExists);
    /// Moves within one file system; the target is never seen in part. Flushes the folder to the disk.
    static bool Rename(String const & from, String const & to, IfExists ifExists);

    /// Makes the folder and those above it that are missing; true if it is there afterwards.
    static bool CreateFolders(String const & path);
    /// Names, not paths, of what lies in the folder, in byte order, "." and ".." left out. False if it can't be read.
    static bool ListFolder(String const & path, std::vector<String> & names);
    /// Flushes a folder's list of names to the disk, which makes a creation or a rename in it lasting.
    static bool FlushFolder(String const & path);

    /// The path with links and "." and ".." resolved, from the root. What does not exist is kept as it is written. An
    /// empty path gives the current folder.
    [[nodiscard]] static String GetCanonicalPath(String const & path);
    /// The path from the root, with "." and ".." resolved as text and links left alone.
    [[nodiscard]] static String GetAbsolutePath(String const & path);
    /// `path` as seen from `folder`; both are made absolute as text first.
    [[nodiscard]] static String GetRelativePath(String const & path, String const & folder);
    /// The folder for temporary files (TMPDIR, else /tmp).
    [[nodiscard]] static String GetTemporaryFolder();
};

/// The system's sentence for an `errno` value, such as "No space left on device".
[[nodiscard]] String GetSystemErrorText(int errorNumber);

}
