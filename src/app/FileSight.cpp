#include "app/FileSight.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace App
{

FileSight FileSight::Of(std::string const & path)
{
    FileSight sight;
    struct stat facts
    {
    };
    if (0 != stat(path.c_str(), &facts)) {
        return sight;
    }
    sight.m_Exists = true;
    sight.m_Device = facts.st_dev;
    sight.m_Inode = facts.st_ino;
    sight.m_Size = facts.st_size;
    sight.m_Modified = static_cast<std::int64_t>(facts.st_mtim.tv_sec) * 1'000'000'000 + facts.st_mtim.tv_nsec;
    int const file = S_ISREG(facts.st_mode) ? open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK) : -1;
    if (0 <= file) {
        sight.m_CanBeRead = true;
        // Asks whether a shared lock would be given, and takes none.
        struct flock lock
        {
        };
        lock.l_type = F_RDLCK;
        lock.l_whence = SEEK_SET;
        sight.m_IsLocked = 0 == fcntl(file, F_OFD_GETLK, &lock) && F_UNLCK != lock.l_type;
        close(file);
    }
    return sight;
}

}
