#include "framework/kernel/Archive.h"

#include "framework/kernel/Abortable.h"
#include "framework/kernel/ArchiveFormat.h"
#include "framework/kernel/ArchiveReader.h"
#include "framework/kernel/ArchiveWriter.h"
#include "framework/kernel/Assert.h"
#include "framework/kernel/DiskFault.h"
#include "framework/kernel/FileIOException.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/MemoryStreams.h"
#include "framework/kernel/Path.h"

#include <cerrno>
#include <cstring>
#include <sys/stat.h>

namespace Kernel
{

namespace
{

Archive::OpenResult ToOpenResult(File::OpenUnmanagedResult result)
{
    switch (result) {
    case File::OpenUnmanagedResult::Success:
    case File::OpenUnmanagedResult::SuccessReadOnly:
        return Archive::OpenResult::Success;
    case File::OpenUnmanagedResult::NotFound:
    case File::OpenUnmanagedResult::NameTooLong:
        return Archive::OpenResult::Missing;
    case File::OpenUnmanagedResult::IsFolder:
        return Archive::OpenResult::IsFolder;
    case File::OpenUnmanagedResult::PermissionDenied:
        return Archive::OpenResult::PermissionDenied;
    case File::OpenUnmanagedResult::SharingViolation:
    case File::OpenUnmanagedResult::LockViolation:
    case File::OpenUnmanagedResult::Busy:
        return Archive::OpenResult::Locked;
    case File::OpenUnmanagedResult::TooManyOpenFiles:
        return Archive::OpenResult::TooManyOpenFiles;
    case File::OpenUnmanagedResult::DeviceError:
        return Archive::OpenResult::ReadError;
    default:
        return Archive::OpenResult::AccessDenied;
    }
}

Archive::CreateResult::Code ToCreateCode(File::OpenUnmanagedResult result)
{
    using Code = Archive::CreateResult::Code;
    switch (result) {
    case File::OpenUnmanagedResult::NotFound:
    case File::OpenUnmanagedResult::FolderMissing:
        return Code::FolderMissing;
    case File::OpenUnmanagedResult::AccessDenied:
        return Code::AccessDenied;
    case File::OpenUnmanagedResult::PermissionDenied:
        return Code::PermissionDenied;
    case File::OpenUnmanagedResult::SharingViolation:
    case File::OpenUnmanagedResult::LockViolation:
        return Code::Locked;
    case File::OpenUnmanagedResult::Busy:
        return Code::Busy;
    case File::OpenUnmanagedResult::ReadOnlyVolume:
        return Code::ReadOnlyVolume;
    case File::OpenUnmanagedResult::IsFolder:
        return Code::IsFolder;
    case File::OpenUnmanagedResult::TooManyOpenFiles:
        return Code::TooManyOpenFiles;
    case File::OpenUnmanagedResult::OutOfMemory:
        return Code::OutOfMemory;
    case File::OpenUnmanagedResult::DeviceError:
        return Code::DeviceError;
    case File::OpenUnmanagedResult::DiskFull:
        return Code::OutOfSpace;
    case File::OpenUnmanagedResult::QuotaExceeded:
        return Code::QuotaExceeded;
    case File::OpenUnmanagedResult::NameTooLong:
        return Code::NameTooLong;
    default:
        return Code::Unknown;
    }
}

/// With what the general reasons of files do not tell apart.
ArchiveFileException FailureOf(Archive const * archive, FileIOException const & exception)
{
    auto const whatFile = exception.IsWriting() ? ArchiveFileException::WhatFile::Written
                                                : ArchiveFileException::WhatFile::Read;
    return ArchiveFileException(archive, ArchiveFileException::ReasonFromErrno(exception.GetErrno()), whatFile, nullptr,
                                exception.GetMessage());
}

/// A pipe or a device: opening or reading one may never end.
bool IsSpecialFile(String const & path)
{
    struct stat facts;
    return ::stat(path.c_str(), &facts) == 0 && !S_ISREG(facts.st_mode) && !S_ISDIR(facts.st_mode);
}

}

Archive::Archive(String path, IDTag type) : m_Path(std::move(path)), m_Type(type) {}

Archive::~Archive() = default;

std::optional<IDTag> Archive::IdentifyType(void const * start, std::size_t size)
{
    using namespace ArchiveFormat;
    auto const * const bytes = static_cast<char const *>(start);
    if (size <= VersionOffset || std::memcmp(bytes, "PK\3\4", 4) != 0 ||
        std::string_view(bytes + LocalHeaderSize, TypeEntry.size()) != TypeEntry ||
        std::string_view(bytes + TypeOffset, TypePrefix.size()) != TypePrefix ||
        std::string_view(bytes + TagOffset + 4, VersionMark.size()) != VersionMark) {
        return std::nullopt;
    }
    std::uint32_t tag = 0;
    for (std::size_t i = 0; i < 4; ++i) {
        tag = tag << 8 | static_cast<unsigned char>(bytes[TagOffset + i]);
    }
    return IDTag(tag);
}

std::optional<IDTag> Archive::IdentifyType(String const & path)
{
    File file;
    if (IsSpecialFile(path) ||
        file.OpenEx(path.c_str(), "rb", File::ShareMode::Shared, File::VisibilityMode::Normal) !=
        File::OpenUnmanagedResult::Success) {
        return std::nullopt;
    }
    char start[ArchiveFormat::LookSize];
    try {
        return IdentifyType(start, file.Read(start, sizeof(start)));
    } catch (FileIOException const &) {
        return std::nullopt;
    }
}

Counted<Archive> Archive::Open(String const & path, OpenMode mode, IDTag type, OpenResult & result)
{
    if (IsSpecialFile(path)) {
        result = OpenResult::NotAnArchive;
        return nullptr;
    }
    if (mode == OpenMode::ReadUnlocked) {
        auto file = std::make_shared<File>();
        result = ToOpenResult(file->OpenEx(path.c_str(), "rb", File::ShareMode::Shared, File::VisibilityMode::Normal));
        if (result != OpenResult::Success) {
            return nullptr;
        }
        Counted<Archive> archive(new Archive(path, type));
        FileSystem::GetModifiedTime(path, archive->m_ModifiedTime);
        archive->m_Reader = Reader::Open(std::move(file), type, result);
        return archive->m_Reader ? archive : nullptr;
    }
    FileLock::Result locked{};
    auto const kind = mode == OpenMode::Read ? FileLock::Kind::Shared : FileLock::Kind::Exclusive;
    Counted<FileLock> lock = FileLock::Acquire(path, kind, locked);
    if (!lock) {
        int const error = errno;
        result = locked == FileLock::Result::Locked ? OpenResult::Locked : ToOpenResult(File::ResultFromErrno(error));
        return nullptr;
    }
    return OpenLocked(std::move(lock), type, result);
}

Counted<Archive> Archive::OpenLocked(Counted<FileLock> lock, IDTag type, OpenResult & result)
{
    String const path = lock->GetFile()->GetPath();
    Counted<Archive> archive(new Archive(path, type));
    FileSystem::GetModifiedTime(path, archive->m_ModifiedTime);
    archive->m_Reader = Reader::Open(lock->GetFile(), type, result);
    archive->m_Lock = std::move(lock);
    return archive->m_Reader ? archive : nullptr;
}

String Archive::GetResultText(OpenResult result, String const & path)
{
    LocalisedString const texts[] = {
        LocalisedString("%1 is open.", "File"),
        LocalisedString("%1 does not exist.", "File"),
        LocalisedString("%1 is a folder, not a file.", "File"),
        LocalisedString("You have no permission to read %1.", "File"),
        LocalisedString("Access to %1 was denied by the system.", "File"),
        LocalisedString("%1 is open elsewhere. Close it there first.", "File"),
        LocalisedString("%1 cannot be opened because too many files are open.", "File"),
        LocalisedString("%1 cannot be read: the disk reports an error.", "File"),
        LocalisedString("%1 is not a file of this program. Choose another one.", "File"),
        LocalisedString("%1 is a file of this program, but of another kind than expected. Choose another one.",
                        "File"),
        LocalisedString("%1 was written by a later version of this program. Update the program to open it.", "File"),
        LocalisedString("%1 ends too early; the copy may be incomplete. Restore it from a backup.", "File"),
        LocalisedString("%1 is damaged. Restore it from a backup.", "File"),
    };
    return Format(texts[static_cast<int>(result)], path);
}

Counted<Archive> Archive::CreateWithTemporary(String const & path, IDTag type, CreateResult & result)
{
    return CreateWithTemporary(path, type, result, nullptr);
}

Counted<Archive> Archive::CreateWithTemporary(String const & path, IDTag type, CreateResult & result,
                                              FileLock * ownLock)
{
    if (Path::GetFileName(path).Empty()) {
        result.m_Code = CreateResult::IsFolder;
        result.m_Text = path.Empty() ? String(LocalisedString("There is no name to save under. Choose one.", "File"))
                                     : File::GetResultText(File::OpenUnmanagedResult::IsFolder, path);
        return nullptr;
    }
    if (IsSpecialFile(path)) {
        result.m_Code = CreateResult::AccessDenied;
        result.m_Text = Format(LocalisedString("%1 is a device or a pipe, not a file. Choose another name.", "File"), path);
        return nullptr;
    }
    File::OpenUnmanagedResult opened{};
    auto file = ReplacementFile::Create(path, File::ShareMode::RespectLocks, ownLock, opened);
    if (!file) {
        result.m_Code = ToCreateCode(opened);
        result.m_Text =
            result.m_Code == CreateResult::FolderMissing
                ? Format(LocalisedString("The folder %1 does not exist. Make it first.", "File"), Path::GetFolder(path))
                : File::GetResultText(opened, path);
        return nullptr;
    }
    result = CreateResult();
    Counted<Archive> archive(new Archive(path, type));
    archive->m_Writer = std::make_unique<Writer>(std::move(file));
    return archive;
}

std::vector<String> Archive::GetItemNames() const
{
    return m_Reader ? m_Reader->GetNames() : std::vector<String>();
}

bool Archive::HasItem(String const & name) const
{
    return m_Reader && m_Reader->Find(name) != nullptr;
}

std::optional<std::uint64_t> Archive::GetItemSize(String const & name) const
{
    Reader::Item const * const item = m_Reader ? m_Reader->Find(name) : nullptr;
    return item ? std::optional<std::uint64_t>(item->m_Size) : std::nullopt;
}

Counted<RawData const> Archive::ReadItem(String const & name) const
{
    Reader::Item const * const item = m_Reader ? m_Reader->Find(name) : nullptr;
    if (!item) {
        return nullptr;
    }
    try {
        return m_Reader->Read(name, *item);
    } catch (FileIOException const & exception) {
        throw FailureOf(this, exception);
    }
}

bool Archive::LoadFile(String const & name, FileStoreItem & item)
{
    Counted<RawData const> data = ReadItem(name);
    if (!data) {
        return false;
    }
    MemoryInStream stream(std::move(data), ConcatString({m_Path, " (", name, ")"}));
    return item.Load(stream, *this);
}

Archive::SessionResult Archive::CreateSessionAdv(ArchiveSessionHandle & handle, SessionType, bool const * abort,
                                                 bool verify)
{
    if (!m_Writer || m_Writer->m_HadSession || !m_Writer->m_File->IsInPlace()) {
        return SessionResult::NotWritable;
    }
    m_Writer->m_HadSession = true;
    m_Writer->m_Abort = abort;
    m_Writer->m_Verify = verify;
    handle.m_Session = Counted<ArchiveSession>(new ArchiveSession(this));
    return SessionResult::Success;
}

void Archive::CloseSession(ArchiveSessionHandle & handle, bool discard)
{
    KORVANE_ASSERT(handle.m_Session && handle.m_Session->m_Archive.Get() == this && m_Writer);
    std::unique_ptr<Writer> const writer = std::move(m_Writer);
    handle.m_Session->m_Archive = nullptr;
    if (discard || Abortable::IsFlagSet(const_cast<bool *>(writer->m_Abort))) {
        return;
    }
    if (Counted<RawData const> const thumbnail =
            writer->m_Thumbnails ? writer->m_Thumbnails->GetFile(ArchiveThumbnails::FileType::Png) : nullptr) {
        writer->Add(ArchiveThumbnails::GetItemName(ArchiveThumbnails::FileType::Png), 0, thumbnail);
    }
    try {
        writer->Write(m_Type);
        if (writer->m_Verify) {
            writer->Verify(m_Type);
        }
        m_Unchanged = writer->m_File->Commit(true) == ReplacementFile::Outcome::Unchanged;
        m_Lock = writer->m_File->TakeLock();
        FileSystem::GetModifiedTime(m_Path, m_ModifiedTime);
    } catch (FileIOException const & exception) {
        throw FailureOf(this, exception);
    }
}

}
