#include "app/BookFileLock.h"
#include "import/Text.h"

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

namespace App
{

using Import::Text;

BookFileLock::~BookFileLock()
{
    if (0 <= m_File) {
        // While it is locked: nobody else can have begun to use this file.
        unlink(m_Path.c_str());
        close(m_File);
    }
}

bool BookFileLock::Take(std::filesystem::path const & book, std::string & problem)
{
    m_Path = book.string() + ".lock";
    for (int attempt = 0; attempt < 10; ++attempt) {
        int const file = open(m_Path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0666);
        if (file < 0) {
            problem = Text("The lock %1 cannot be made: %2.", "Program", m_Path.string(), std::strerror(errno));
            return false;
        }
        if (0 != flock(file, LOCK_EX | LOCK_NB)) {
            char owner[64] = {};
            ssize_t const length = read(file, owner, sizeof owner - 1);
            close(file);
            problem = 0 < length
                          ? Text("Another program is at work on this book (process %1); wait until it has ended.",
                                 "Program", std::string(owner, static_cast<std::size_t>(length)))
                          : Text("Another program is at work on this book; wait until it has ended.", "Program");
            return false;
        }
        // The one before may have removed the file between our opening and locking it.
        struct stat ours
        {
        };
        struct stat there
        {
        };
        if (0 == fstat(file, &ours) && 0 == stat(m_Path.c_str(), &there) && ours.st_ino == there.st_ino) {
            std::string const owner = std::to_string(getpid());
            m_File = file;
            if (0 != ftruncate(file, 0) ||
                static_cast<ssize_t>(owner.size()) != write(file, owner.data(), owner.size())) {
                // A lock that can't name its owner still locks.
                return true;
            }
            return true;
        }
        close(file);
    }
    problem = Text("The lock %1 cannot be had; try again.", "Program", m_Path.string());
    return false;
}

}
