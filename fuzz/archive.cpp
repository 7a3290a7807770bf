#include "framework/kernel/Archive.h"

#include <cstdlib>
#include <string>
#include <sys/mman.h>
#include <unistd.h>

using namespace Kernel;

namespace
{

/// The input as a file in memory: the archive reads through a path.
class MemoryFile
{
public:
    MemoryFile() : m_Descriptor(::memfd_create("fuzz", MFD_CLOEXEC)) {}
    [[nodiscard]] String GetPath() const { return String("/proc/self/fd/" + std::to_string(m_Descriptor)); }
    [[nodiscard]] bool Set(std::uint8_t const * data, std::size_t size) const
    {
        return ::ftruncate(m_Descriptor, 0) == 0 && ::pwrite(m_Descriptor, data, size, 0) == static_cast<ssize_t>(size);
    }

private:
    int const m_Descriptor;
};

}

/// Any bytes are refused with a result or an exception, or give items of exactly their declared size.
extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const * data, std::size_t size)
{
    static MemoryFile const file;
    if (!file.Set(data, size)) {
        return 0;
    }
    Archive::OpenResult result{};
    auto const archive = Archive::Open(file.GetPath(), Archive::OpenMode::ReadUnlocked, IDTag("KvFz"), result);
    if (static_cast<bool>(archive) != (result == Archive::OpenResult::Success)) {
        std::abort();
    }
    if (!archive) {
        return 0;
    }
    for (String const & name : archive->GetItemNames()) {
        try {
            auto const content = archive->ReadItem(name);
            if (!content || content->GetSize() != archive->GetItemSize(name)) {
                std::abort();
            }
        } catch (Exception const &) {
            // Refused, with a sentence that says where.
        }
    }
    return 0;
}
