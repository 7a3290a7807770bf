#include "framework/kernel/ArchiveReader.h"

#include "framework/kernel/ArchiveFormat.h"
#include "framework/kernel/FileIOException.h"
#include "framework/kernel/LocalisedString.h"

#include <algorithm>
#include <cstring>
#include <libdeflate.h>
#include <limits>
#include <zip.h>

namespace Kernel
{

namespace
{

using namespace ArchiveFormat;

/// Deflate cannot make more than this of one byte (RFC 1951: 258 bytes for two bits).
constexpr std::uint64_t MaximumExpansion = 1032;
constexpr zip_int64_t MaximumItems = 65535;
constexpr std::size_t MaximumNameLength = 1024;

/// The file ends with the record that ends every container of ours, whatever lies before it.
bool HasEnd(File const & file)
{
    constexpr std::size_t EndSize = 22;
    std::uint64_t const size = file.GetSize();
    char signature[4];
    return EndSize <= size && file.ReadAt(size - EndSize, signature, sizeof(signature)) == sizeof(signature) &&
           std::memcmp(signature, "PK\5\6", sizeof(signature)) == 0;
}

/// What the first bytes say; Success if they say that it is ours.
Archive::OpenResult CheckStart(File const & file, IDTag type)
{
    char start[LookSize];
    std::size_t const size = file.ReadAt(0, start, sizeof(start));
    std::string const expected = TypeText(type);
    constexpr std::size_t Signature = 4;
    std::size_t const common = std::min(size, Signature);
    if (size == 0 || std::memcmp(start, "PK\3\4", common) != 0) {
        return size == 0 ? Archive::OpenResult::Truncated : Archive::OpenResult::NotAnArchive;
    }
    std::optional<IDTag> const found = Archive::IdentifyType(start, size);
    if (!found) {
        // A start of ours that just ends early, or somebody else's container.
        bool const begins =
            size < VersionOffset + 1 &&
            (size <= LocalHeaderSize || std::memcmp(start + LocalHeaderSize, TypeEntry.data(),
                                                    std::min(size - LocalHeaderSize, TypeEntry.size())) == 0);
        return begins ? Archive::OpenResult::Truncated : Archive::OpenResult::NotAnArchive;
    }
    if (*found != type) {
        return Archive::OpenResult::OtherType;
    }
    char const version = start[VersionOffset];
    if (version < '0' || '9' < version) {
        return Archive::OpenResult::Corrupt;
    }
    return Version < version ? Archive::OpenResult::NewerVersion : Archive::OpenResult::Success;
}

}

std::unique_ptr<Archive::Reader> Archive::Reader::Open(std::shared_ptr<File> file, IDTag type, OpenResult & result)
{
    std::unique_ptr<Reader> reader(new Reader(std::move(file)));
    try {
        result = CheckStart(*reader->m_File, type);
        if (result != OpenResult::Success) {
            return nullptr;
        }
        zip_error_t error;
        zip_error_init(&error);
        zip_source_t * const source = reader->m_Source.MakeSource();
        reader->m_Zip = source ? zip_open_from_source(source, ZIP_RDONLY | ZIP_CHECKCONS, &error) : nullptr;
        if (!reader->m_Zip) {
            zip_error_fini(&error);
            zip_source_free(source);
            reader->m_Source.ThrowFailure();
            result = HasEnd(*reader->m_File) ? OpenResult::Corrupt : OpenResult::Truncated;
            return nullptr;
        }
        if (!reader->ReadDirectory()) {
            result = OpenResult::Corrupt;
            return nullptr;
        }
    } catch (FileIOException const &) {
        result = OpenResult::ReadError;
        return nullptr;
    }
    return reader;
}

Archive::Reader::~Reader()
{
    if (m_Zip) {
        zip_discard(m_Zip);
    }
}

bool Archive::Reader::ReadDirectory()
{
    zip_int64_t const count = zip_get_num_entries(m_Zip, 0);
    if (count < 1 || MaximumItems < count) {
        return false;
    }
    std::uint64_t const fileSize = m_File->GetSize();
    for (zip_int64_t i = 0; i < count; ++i) {
        zip_stat_t stat;
        constexpr zip_uint64_t Needed = ZIP_STAT_NAME | ZIP_STAT_SIZE | ZIP_STAT_COMP_SIZE | ZIP_STAT_CRC |
                                        ZIP_STAT_COMP_METHOD | ZIP_STAT_ENCRYPTION_METHOD;
        if (zip_stat_index(m_Zip, static_cast<zip_uint64_t>(i), ZIP_FL_ENC_RAW, &stat) != 0 ||
            (stat.valid & Needed) != Needed) {
            return false;
        }
        bool const deflated = stat.comp_method == ZIP_CM_DEFLATE;
        if ((!deflated && stat.comp_method != ZIP_CM_STORE) || stat.encryption_method != ZIP_EM_NONE ||
            MaximumNameLength < std::strlen(stat.name) || fileSize < stat.comp_size ||
            (!deflated && stat.size != stat.comp_size) || stat.comp_size * MaximumExpansion + 64 < stat.size) {
            return false;
        }
        String const name(stat.name);
        if (i == 0) {
            if (name != TypeEntry || deflated) {
                return false;
            }
            continue;
        }
        if (!m_Items.emplace(name, Item{stat.index, stat.size, stat.comp_size, stat.crc, deflated}).second) {
            return false;
        }
        m_Names.push_back(name);
    }
    return true;
}

Archive::Reader::Item const * Archive::Reader::Find(String const & name) const
{
    auto const found = m_Items.find(name);
    return found == m_Items.end() ? nullptr : &found->second;
}

void Archive::Reader::Fail(String const & name, String const & fault) const
{
    throw ArchiveCorruptionException(m_File->GetPath(), name, fault);
}

void Archive::Reader::ReadRaw(String const & name, Item const & item, std::uint8_t * target) const
{
    ScopedLock lock(m_Lock);
    // As it lies in the file: inflating and the checksum are done here, by a library several times as fast.
    zip_file_t * const file = zip_fopen_index(m_Zip, item.m_Index, ZIP_FL_COMPRESSED);
    if (!file) {
        m_Source.ThrowFailure();
        Fail(name, LocalisedString("the item cannot be found where the directory says", "Damage"));
    }
    zip_int64_t const got = zip_fread(file, target, item.m_CompressedSize);
    zip_fclose(file);
    m_Source.ThrowFailure();
    if (got < 0 || static_cast<std::uint64_t>(got) != item.m_CompressedSize) {
        Fail(name, LocalisedString("the item is cut off", "Damage"));
    }
}

Counted<RawData const> Archive::Reader::Read(String const & name, Item const & item) const
{
    if (MaximumItemSize < item.m_Size) {
        Fail(name, LocalisedString("the item is larger than any that we write", "Damage"));
    }
    auto data = MakeCounted<RawData>(item.m_Size);
    if (!item.m_Deflated) {
        ReadRaw(name, item, data->GetMutableData());
    } else {
        std::vector<std::uint8_t> compressed(item.m_CompressedSize);
        ReadRaw(name, item, compressed.data());
        std::unique_ptr<libdeflate_decompressor, decltype(&libdeflate_free_decompressor)> const decompressor(
            libdeflate_alloc_decompressor(), &libdeflate_free_decompressor);
        // Never writes more than the declared size, and fails unless it comes out exactly.
        libdeflate_result const result = libdeflate_deflate_decompress(
            decompressor.get(), compressed.data(), compressed.size(), data->GetMutableData(), data->GetSize(), nullptr);
        if (result != LIBDEFLATE_SUCCESS) {
            Fail(name, LocalisedString("the item's compressed bytes do not hold together", "Damage"));
        }
    }
    if (libdeflate_crc32(0, data->GetData(), data->GetSize()) != item.m_Checksum) {
        Fail(name, LocalisedString("the item's checksum does not match its content", "Damage"));
    }
    return data;
}

}
