#pragma once

#include "framework/kernel/StringT.h"
#include "framework/raster/Picture.h"

#include <cstdint>
#include <map>
#include <span>
#include <vector>

/// A folder of a package that files are collected in, each under its own name. A file of another content that has the
/// name already keeps it, and the new one takes a number. Names that differ in case alone, or in how an accent is
/// written, count as one: on some systems that a package goes to they are. For one thread.
class PackageFolder
{
public:
    struct File
    {
        /// Its place, from the folder on, with `/`.
        String m_Name;
        Raster::Picture::Bytes m_Bytes;
    };

    /// The folder is made when the first file goes in; the one that it lies in must be there.
    explicit PackageFolder(String folder) : m_Folder(std::move(folder)) {}

    /// Puts the bytes in and gives the file's name, or none, with a sentence for the user in `problem`.
    [[nodiscard]] String Put(String const & name, std::span<std::uint8_t const> bytes, String & problem);
    /// Puts files in that find each other by their places, in a folder of their own that is named for the first. Gives
    /// the first one's place in this folder, or none, with a sentence for the user in `problem`.
    [[nodiscard]] String PutTogether(std::vector<File> const & files, String & problem);

    /// Equal for names that are one on some systems.
    [[nodiscard]] static String Fold(String const & name);

private:
    /// The name under which the folder holds this one; none if it is free.
    [[nodiscard]] String FindTaken(String const & name);

    String const m_Folder;
    /// What lies in it, by folded name; read when it is first asked.
    std::map<String, String> m_Names;
    bool m_IsListed = false;
};
