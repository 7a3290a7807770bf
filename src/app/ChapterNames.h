#pragma once

#include <filesystem>
#include <string>
#include <vector>

namespace App
{

/// What a chapter of a book is known by.
struct ChapterLabel
{
    std::string m_Name;
    std::string m_Path;
};

/// The chapter that was meant, or why there is none.
struct FoundChapter
{
    /// From 0; -1 if none or several are meant.
    int m_Index = -1;
    /// A sentence with the chapters that may be meant.
    std::string m_Problem;
};

/// Finds the chapter that the user calls `text`: by its number from 1; else by its path, from `folder`; else by its
/// file's name with or without the extension, or the name that the book shows. A name that fits several chapters is
/// refused with their numbers, since guessing would change the wrong one. A chapter that is named by a number ("1984")
/// is found by it if the book has no such number.
[[nodiscard]] FoundChapter FindChapter(std::vector<ChapterLabel> const & chapters, std::string const & text,
                                       std::filesystem::path const & folder);

}
