#include "framework/render/PdfSpill.h"

#include "framework/kernel/DiskFault.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"

#include <cerrno>
#include <cstdlib>
#include <fcntl.h>
#include <unistd.h>

namespace Renderer::RenderTree
{

namespace
{

constexpr std::size_t BufferSize = std::size_t(1) << 18;

std::string Sentence(Kernel::LocalisedString const & text, int errorNumber)
{
    return Kernel::Format(text, Kernel::FileSystem::GetTemporaryFolder(), Kernel::GetSystemErrorText(errorNumber))
        .ToStd();
}

}

PdfSpill::~PdfSpill()
{
    if (m_File >= 0) {
        close(m_File);
    }
}

bool PdfSpill::Open(std::string & error)
{
    String const folder = Kernel::FileSystem::GetTemporaryFolder();
    if (Kernel::DiskFault::Ask(Kernel::DiskOperation::Open, folder.c_str()) == 0) {
        m_File = open(folder.c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC, 0600);
        if (m_File < 0 && (errno == EOPNOTSUPP || errno == EISDIR)) {
            // A file system without nameless files.
            std::string name = folder.ToStd() + "/korvane-XXXXXX";
            m_File = mkostemp(name.data(), O_CLOEXEC);
            if (m_File >= 0) {
                unlink(name.c_str());
            }
        }
    }
    if (m_File < 0) {
        error = Sentence(Kernel::LocalisedString("A temporary file can't be made in %1: %2.", "File"), errno);
        return false;
    }
    m_Buffer.reserve(BufferSize);
    return true;
}

bool PdfSpill::Flush()
{
    std::size_t done = 0;
    while (m_Error.empty() && done < m_Buffer.size()) {
        ssize_t const count = Kernel::DiskFault::Ask(Kernel::DiskOperation::Write, "") != 0
                                  ? -1
                                  : pwrite(m_File, m_Buffer.data() + done, m_Buffer.size() - done,
                                           static_cast<off_t>(m_Written + done));
        if (count > 0) {
            done += static_cast<std::size_t>(count);
        } else if (count == 0 || errno != EINTR) {
            m_Error = Sentence(Kernel::LocalisedString("Temporary data can't be written in %1: %2.", "File"),
                               count == 0 ? ENOSPC : errno);
        }
    }
    m_Written += m_Buffer.size();
    m_Buffer.clear();
    return m_Error.empty();
}

SpillRange PdfSpill::Append(void const * data, std::size_t size)
{
    std::lock_guard const lock(m_Lock);
    if (m_Buffer.size() + size > BufferSize) {
        Flush();
    }
    SpillRange const range{m_Written + m_Buffer.size(), size};
    char const * bytes = static_cast<char const *>(data);
    m_Buffer.insert(m_Buffer.end(), bytes, bytes + size);
    if (m_Buffer.size() > BufferSize) {
        // Too big for the buffer: it has gone through it alone, and the buffer goes back to its size.
        Flush();
        m_Buffer.shrink_to_fit();
        m_Buffer.reserve(BufferSize);
    }
    return range;
}

bool PdfSpill::Read(SpillRange const & range, std::uint64_t offset, void * target, std::size_t size)
{
    std::lock_guard const lock(m_Lock);
    if (!Flush() || offset + size > range.m_Length) {
        return false;
    }
    std::size_t done = 0;
    while (done < size) {
        ssize_t const count = pread(m_File, static_cast<char *>(target) + done, size - done,
                                    static_cast<off_t>(range.m_Offset + offset + done));
        if (count == 0 || (count < 0 && errno != EINTR)) {
            m_Error = Sentence(Kernel::LocalisedString("Temporary data can't be read back in %1: %2.", "File"),
                               count == 0 ? EIO : errno);
            return false;
        }
        done += count > 0 ? static_cast<std::size_t>(count) : 0;
    }
    return true;
}

std::string PdfSpill::GetError() const
{
    std::lock_guard const lock(m_Lock);
    return m_Error;
}

}
