#include "framework/raster/Picture.h"

#include "framework/kernel/DiskFault.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/raster/PictureReader.h"

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <limits>
#include <new>
#include <sys/stat.h>
#include <unistd.h>

namespace Raster
{

namespace
{

using Code = PictureProblem::Code;

/// Headers are read from so many bytes of the front; the rare longer ones from the whole file.
constexpr std::size_t HeaderSize = std::size_t(1) << 16;

void ReportErrno(PictureProblem & problem, String const & path, int errorNumber)
{
    if (errorNumber == ENOENT || errorNumber == ENOTDIR) {
        Report(problem, Code::NotFound, path, Kernel::LocalisedString("does not exist", "Picture"));
    } else if (errorNumber == EACCES || errorNumber == EPERM) {
        Report(problem, Code::AccessDenied, path, Kernel::LocalisedString("may not be read", "Picture"));
    } else {
        Report(problem, Code::ReadError, path, Kernel::LocalisedString("can't be read: %1", "Picture"),
               Kernel::GetSystemErrorText(errorNumber));
    }
}

/// Closes on the way out.
struct OpenFile
{
    int m_File = -1;
    ~OpenFile()
    {
        if (m_File >= 0) {
            close(m_File);
        }
    }
};

/// The first `limit` bytes; `whole` says that they are all.
bool ReadFile(String const & path, std::size_t limit, std::vector<unsigned char> & bytes, bool & whole,
              PictureProblem & problem)
{
    OpenFile file;
    if (Kernel::DiskFault::Ask(Kernel::DiskOperation::Open, path.c_str()) == 0) {
        // Not blocking, as a name may be a pipe's.
        file.m_File = open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
    }
    struct stat status{};
    if (file.m_File < 0 || fstat(file.m_File, &status) != 0) {
        ReportErrno(problem, path, errno);
        return false;
    }
    if (!S_ISREG(status.st_mode)) {
        Report(problem, Code::UnknownKind, path, Kernel::LocalisedString("is no file", "Picture"));
        return false;
    }
    std::size_t const size = static_cast<std::size_t>(status.st_size);
    bytes.resize(std::min(limit, size));
    whole = bytes.size() == size;
    for (std::size_t done = 0; done < bytes.size();) {
        ssize_t const count = Kernel::DiskFault::Ask(Kernel::DiskOperation::Read, path.c_str()) != 0
                                  ? -1
                                  : read(file.m_File, bytes.data() + done, bytes.size() - done);
        if (count < 0 && errno != EINTR) {
            ReportErrno(problem, path, errno);
            return false;
        }
        if (count == 0) {
            bytes.resize(done);
        }
        done += count > 0 ? static_cast<std::size_t>(count) : 0;
    }
    return true;
}

void ReadInfo(PictureBytes bytes, PictureInfo & info)
{
    if (IsPng(bytes)) {
        ReadPngInfo(ScanPng(bytes, true), info);
    } else if (IsJpeg(bytes)) {
        ReadJpegInfo(ScanJpeg(bytes, true), info);
    } else {
        throw PictureFault{Code::UnknownKind, bytes.empty()
                                                  ? Kernel::LocalisedString("is empty", "Picture")
                                                  : Kernel::LocalisedString("is neither PNG nor JPEG", "Picture")};
    }
}

bool HasWrongExtension(String const & path, PictureKind kind)
{
    std::string_view const text = path.View();
    std::size_t const dot = text.rfind('.');
    if (dot == std::string_view::npos || text.find('/', dot) != std::string_view::npos) {
        return false;
    }
    std::string extension(text.substr(dot + 1));
    for (char & character : extension) {
        character = character >= 'A' && character <= 'Z' ? static_cast<char>(character - 'A' + 'a') : character;
    }
    bool const png = extension == "png";
    bool const jpeg = extension == "jpg" || extension == "jpeg" || extension == "jpe" || extension == "jfif";
    return kind == PictureKind::Png ? !png : !jpeg;
}

Kernel::Counted<DynamicBitmap> Upright(Kernel::Counted<DynamicBitmap> const & stored, int orientation)
{
    bool const turned = orientation >= 5;
    int const width = turned ? stored->GetHeight() : stored->GetWidth();
    int const height = turned ? stored->GetWidth() : stored->GetHeight();
    Kernel::Counted<DynamicBitmap> upright = Kernel::MakeCounted<DynamicBitmap>();
    upright->Create(width, height, stored->GetFormat(), stored->GetMipmapMode(), stored->GetHardwareCachePolicy());
    std::size_t const size = BytesPerPixel(stored->GetFormat());
    bool const flipX = orientation == 2 || orientation == 3 || orientation == 6 || orientation == 7;
    bool const flipY = orientation == 3 || orientation == 4 || orientation == 7 || orientation == 8;
    for (int y = 0; y < stored->GetHeight(); ++y) {
        std::uint8_t const * source = stored->GetRow(y);
        for (int x = 0; x < stored->GetWidth(); ++x, source += size) {
            int const column = turned ? y : x;
            int const row = turned ? x : y;
            std::uint8_t * const target = upright->GetRow(flipY ? height - 1 - row : row) +
                                          static_cast<std::size_t>(flipX ? width - 1 - column : column) * size;
            std::memcpy(target, source, size);
        }
    }
    return upright;
}

}

void Report(PictureProblem & problem, PictureProblem::Code code, String const & path,
            Kernel::LocalisedString const & what, String const & detail)
{
    problem.m_Code = code;
    problem.m_Path = path;
    problem.m_What = what;
    problem.m_Detail = detail;
    problem.m_Text =
        Kernel::Format(Kernel::LocalisedString("The picture %1 %2.", "Picture"), path, Kernel::Format(what, detail));
}

void Report(PictureProblem & problem, PictureProblem::Code code, String const & path,
            Kernel::LocalisedString const & what)
{
    Report(problem, code, path, what, String());
}

void CheckPictureSize(std::uint32_t width, std::uint32_t height)
{
    if (width == 0 || height == 0) {
        throw PictureFault{Code::Corrupt, Kernel::LocalisedString("declares no size", "Picture")};
    }
    if (width > Picture::MaximumSide || height > Picture::MaximumSide ||
        static_cast<std::int64_t>(width) * height > Picture::MaximumPixels) {
        throw PictureFault{
            Code::TooLarge,
            Kernel::LocalisedString("is larger than 65,500 pixels on a side or 200 million in all", "Picture")};
    }
}

Kernel::Counted<Picture const> Picture::FromFile(String const & path, PictureProblem & problem)
{
    std::vector<unsigned char> bytes;
    bool whole = false;
    Kernel::Counted<Picture> picture(new Picture);
    picture->m_Path = path;
    for (std::size_t limit = HeaderSize; ReadFile(path, limit, bytes, whole, problem);
         limit = std::numeric_limits<std::size_t>::max()) {
        try {
            ReadInfo(bytes, picture->m_Info);
            picture->m_Info.m_WrongExtension = HasWrongExtension(path, picture->m_Info.m_Kind);
            return Kernel::Counted<Picture const>(picture);
        } catch (PictureFault const & fault) {
            if (fault.m_Code != Code::Truncated || whole) {
                Report(problem, fault.m_Code, path, fault.m_What);
                return nullptr;
            }
            picture->m_Info = PictureInfo();
        }
    }
    return nullptr;
}

Kernel::Counted<Picture const> Picture::FromBytes(Bytes bytes, String const & name, PictureProblem & problem)
{
    Kernel::Counted<Picture> picture(new Picture);
    picture->m_Path = name;
    picture->m_Bytes = std::move(bytes);
    try {
        ReadInfo(*picture->m_Bytes, picture->m_Info);
    } catch (PictureFault const & fault) {
        Report(problem, fault.m_Code, name, fault.m_What);
        return nullptr;
    }
    return Kernel::Counted<Picture const>(picture);
}

Picture::Bytes Picture::ReadBytes(PictureProblem & problem) const
{
    if (m_Bytes) {
        return m_Bytes;
    }
    return ReadPictureFile(m_Path, problem);
}

Picture::Bytes ReadPictureFile(String const & path, PictureProblem & problem)
{
    auto bytes = std::make_shared<std::vector<unsigned char>>();
    bool whole = false;
    if (!ReadFile(path, std::numeric_limits<std::size_t>::max(), *bytes, whole, problem)) {
        return nullptr;
    }
    return bytes;
}

Kernel::Counted<DynamicBitmap const> Picture::DecodeAsStored(PictureProblem & problem) const
{
    Bytes const bytes = ReadBytes(problem);
    if (!bytes) {
        return nullptr;
    }
    try {
        // The file may have changed since it was opened.
        PictureInfo info;
        ReadInfo(*bytes, info);
        return info.m_Kind == PictureKind::Png ? DecodePng(*bytes, info) : DecodeJpeg(*bytes, info);
    } catch (PictureFault const & fault) {
        Report(problem, fault.m_Code, m_Path, fault.m_What);
    } catch (std::bad_alloc const &) {
        Report(problem, Code::TooLarge, m_Path, Kernel::LocalisedString("needs more memory than there is", "Picture"));
    }
    return nullptr;
}

Kernel::Counted<DynamicBitmap const> Picture::Decode(PictureProblem & problem) const
{
    Kernel::Counted<DynamicBitmap const> stored = DecodeAsStored(problem);
    if (!stored || m_Info.m_Orientation == 1) {
        return stored;
    }
    return Upright(Kernel::Counted<DynamicBitmap>(const_cast<DynamicBitmap *>(stored.Get())), m_Info.m_Orientation);
}

Kernel::Consolidated<ICCProfile> Picture::ReadProfile() const
{
    PictureProblem problem;
    Bytes const bytes = ReadBytes(problem);
    if (!bytes) {
        return nullptr;
    }
    std::vector<unsigned char> data;
    try {
        data = m_Info.m_Kind == PictureKind::Png ? ReadPngProfile(ScanPng(*bytes, true))
                                                 : ReadJpegProfile(ScanJpeg(*bytes, true));
    } catch (PictureFault const &) {
        // The pixels are as damaged as this, and decoding them tells.
        return nullptr;
    }
    String reason;
    Kernel::Consolidated<ICCProfile> profile = data.empty() ? nullptr : ICCProfile::FromBytes(std::move(data), reason);
    return profile && profile->GetSpace() == m_Info.m_Space ? profile : nullptr;
}

}
