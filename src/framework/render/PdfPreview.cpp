#include "framework/render/PdfPreview.h"

#include "framework/kernel/LocalisedString.h"
#include "framework/render/PdfForm.h"
#include "framework/render/PdfSource.h"

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <string>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

namespace Renderer::RenderTree
{

namespace
{

using Code = Raster::PictureProblem::Code;
using Handle = QPDFObjectHandle;

constexpr int LongestMilliseconds = 30'000;
constexpr rlim_t MostMemory = rlim_t(4) << 30;
constexpr off_t LargestResult = off_t(1) << 30;

/// The program's path; empty if it is not installed.
std::string FindProgram()
{
    char const * const folders = std::getenv("PATH");
    std::string const list = folders ? folders : "/usr/bin:/bin";
    for (std::size_t begin = 0; begin <= list.size();) {
        std::size_t const end = std::min(list.find(':', begin), list.size());
        std::string const path = list.substr(begin, end - begin) + "/pdftocairo";
        if (begin < end && 0 == access(path.c_str(), X_OK)) {
            return path;
        }
        begin = end + 1;
    }
    return {};
}

/// A file in memory; closed at the end.
class MemoryFile
{
public:
    MemoryFile() : m_File(memfd_create("drawing", MFD_CLOEXEC)) {}
    ~MemoryFile()
    {
        if (0 <= m_File) {
            close(m_File);
        }
    }
    MemoryFile(MemoryFile const &) = delete;
    MemoryFile & operator=(MemoryFile const &) = delete;

    [[nodiscard]] int Get() const { return m_File; }

    [[nodiscard]] bool Fill(unsigned char const * data, std::size_t size) const
    {
        for (std::size_t done = 0; done < size;) {
            ssize_t const count = write(m_File, data + done, size - done);
            if (count <= 0) {
                return false;
            }
            done += static_cast<std::size_t>(count);
        }
        return 0 == lseek(m_File, 0, SEEK_SET);
    }

    /// Null if there is nothing, or too much.
    [[nodiscard]] Raster::Picture::Bytes Read() const
    {
        off_t const size = lseek(m_File, 0, SEEK_END);
        if (size <= 0 || LargestResult < size) {
            return nullptr;
        }
        auto const bytes = std::make_shared<std::vector<unsigned char>>(static_cast<std::size_t>(size));
        for (std::size_t done = 0; done < bytes->size();) {
            ssize_t const count =
                pread(m_File, bytes->data() + done, bytes->size() - done, static_cast<off_t>(done));
            if (count <= 0) {
                return nullptr;
            }
            done += static_cast<std::size_t>(count);
        }
        return bytes;
    }

private:
    int m_File;
};

/// A file of one page that the drawing fills, without password.
std::shared_ptr<Buffer> MakeOnePage(PdfSource & source, PdfSource::Page const & page, int width, int height)
{
    QPDF pdf;
    pdf.emptyPDF();
    pdf.setSuppressWarnings(true);
    PdfObjectCopier copier(pdf, [&pdf](std::string const & data) { return Handle::newStream(&pdf, data); });
    PdfSource::Content const content = source.ReadContent(page);
    Handle const form = Handle::newStream(&pdf, content.m_Bytes);
    MakeForm(page, content, copier, form);
    std::string const size = std::to_string(width) + " " + std::to_string(height);
    Handle const draw = Handle::newStream(&pdf, std::to_string(width) + " 0 0 " + std::to_string(height) + " 0 0 cm/D Do");
    Handle object = Handle::parse("<</Type/Page/MediaBox[0 0 " + size + "]>>");
    object.replaceKey("/Resources",
                      Handle::newDictionary({{"/XObject", Handle::newDictionary({{"/D", form}})}}));
    object.replaceKey("/Contents", draw);
    pdf.addPage(pdf.makeIndirectObject(object), true);
    QPDFWriter writer(pdf);
    writer.setOutputMemory();
    writer.setStreamDataMode(qpdf_s_preserve);
    writer.setStaticID(true);
    writer.write();
    return writer.getBufferSharedPointer();
}

/// Runs the program; false if it did not end well and in time.
bool Run(std::string const & program, int width, int height, MemoryFile const & in, MemoryFile const & out)
{
    std::string const across = std::to_string(width);
    std::string const down = std::to_string(height);
    char const * const arguments[] = {"pdftocairo",     "-png",       "-singlefile",    "-transp",    "-scale-to-x",
                                      across.c_str(),   "-scale-to-y", down.c_str(),    "-",          "-",
                                      nullptr};
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, in.Get(), 0);
    posix_spawn_file_actions_adddup2(&actions, out.Get(), 1);
    posix_spawn_file_actions_addopen(&actions, 2, "/dev/null", O_WRONLY, 0);
    pid_t child = -1;
    int const failure = posix_spawn(&child, program.c_str(), &actions, nullptr, const_cast<char **>(arguments), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (0 != failure) {
        return false;
    }
    rlimit const memory{MostMemory, MostMemory};
    prlimit(child, RLIMIT_AS, &memory, nullptr);
    // glibc 2.36 declares a function for it that C++ programs can't link.
    int const handle = static_cast<int>(syscall(SYS_pidfd_open, child, 0));
    pollfd waiting{handle, POLLIN, 0};
    int ready = -1;
    do {
        ready = poll(&waiting, 1, LongestMilliseconds);
    } while (ready < 0 && EINTR == errno && 0 <= handle);
    if (ready <= 0) {
        kill(child, SIGKILL);
    }
    if (0 <= handle) {
        close(handle);
    }
    int status = -1;
    while (waitpid(child, &status, 0) < 0 && EINTR == errno) {
    }
    return WIFEXITED(status) && 0 == WEXITSTATUS(status);
}

}

bool CanDrawPdfPages()
{
    return !FindProgram().empty();
}

Kernel::Counted<Raster::DynamicBitmap const> DrawPdfPage(PdfSource & source, int page, int width, int height,
                                                         Raster::PictureProblem & problem)
{
    std::string const program = FindProgram();
    std::optional<PdfSource::Page> const found = source.FindPage(page, problem);
    if (!found) {
        return nullptr;
    }
    if (program.empty()) {
        Raster::Report(
            problem, Code::Unsupported, source.GetPath(),
            Kernel::LocalisedString("can't be shown as pixels, as the program pdftocairo (package poppler-utils) "
                                    "is not installed",
                                    "Picture"));
        return nullptr;
    }
    MemoryFile const in;
    MemoryFile const out;
    Raster::Picture::Bytes drawn;
    try {
        std::shared_ptr<Buffer> const file = MakeOnePage(source, *found, width, height);
        if (in.Fill(file->getBuffer(), file->getSize()) && Run(program, width, height, in, out)) {
            drawn = out.Read();
        }
    } catch (std::exception const &) {
        // The sentence below covers it.
        drawn = nullptr;
    }
    Kernel::Counted<Raster::Picture const> const picture =
        drawn ? Raster::Picture::FromBytes(drawn, source.GetPath(), problem) : nullptr;
    Kernel::Counted<Raster::DynamicBitmap const> const bitmap = picture ? picture->Decode(problem) : nullptr;
    if (!bitmap) {
        Raster::Report(problem, Code::Corrupt, source.GetPath(), Kernel::LocalisedString("can't be drawn", "Picture"));
    }
    return bitmap;
}

}
