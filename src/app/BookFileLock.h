#pragma once

#include <filesystem>
#include <string>

namespace App
{

/// Holds a book for this process, so that a second program that wants to change it can say who has it. The lock lies in
/// a file beside the book ("book.kvbook.lock") that names the process; the system lifts it however the process ends.
class BookFileLock
{
public:
    BookFileLock() = default;
    ~BookFileLock();
    BookFileLock(BookFileLock const &) = delete;
    BookFileLock & operator=(BookFileLock const &) = delete;

    /// False, with a sentence in `problem`, if another process has the book or the lock's file can't be made.
    bool Take(std::filesystem::path const & book, std::string & problem);

private:
    std::filesystem::path m_Path;
    int m_File = -1;
};

}
