#include "framework/kernel/ArchiveWriter.h"

#include "framework/kernel/ArchiveFormat.h"
#include "framework/kernel/ArchiveReader.h"
#include "framework/kernel/Assert.h"
#include "framework/kernel/FileIOException.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/ZipFileSource.h"

#include <algorithm>
#include <cstring>
#include <libdeflate.h>
#include <zip.h>

namespace Kernel
{

namespace
{

/// 1 January 1980, 0:00, the earliest that the format knows: the time of saving would make equal contents unequal.
constexpr zip_uint16_t DosTime = 0;
constexpr zip_uint16_t DosDate = 0x0021;

/// The shorter form of the bytes at this level, or null if that is the bytes themselves.
Counted<RawData const> Deflate(int level, RawData const & data)
{
    if (level == 0 || data.GetSize() == 0) {
        return nullptr;
    }
    std::unique_ptr<libdeflate_compressor, decltype(&libdeflate_free_compressor)> const compressor(
        libdeflate_alloc_compressor(level), &libdeflate_free_compressor);
    RawData::Bytes bytes(libdeflate_deflate_compress_bound(compressor.get(), data.GetSize()));
    std::size_t const size =
        libdeflate_deflate_compress(compressor.get(), data.GetData(), data.GetSize(), bytes.data(), bytes.size());
    if (size == 0 || data.GetSize() <= size) {
        return nullptr;
    }
    bytes.resize(size);
    bytes.shrink_to_fit();
    return MakeCounted<RawData>(std::move(bytes));
}

}

/// Gives libzip an entry's bytes in their final form.
struct ArchiveEntrySource
{
    static zip_int64_t Call(void * state, void * data, zip_uint64_t length, zip_source_cmd_t command)
    {
        auto & entry = *static_cast<Archive::Writer::Entry *>(state);
        switch (command) {
        case ZIP_SOURCE_OPEN:
            entry.m_Read = 0;
            return 0;
        case ZIP_SOURCE_READ: {
            std::size_t const size = std::min<std::size_t>(length, entry.m_Bytes->GetSize() - entry.m_Read);
            std::copy_n(entry.m_Bytes->GetData() + entry.m_Read, size, static_cast<std::uint8_t *>(data));
            entry.m_Read += size;
            return static_cast<zip_int64_t>(size);
        }
        case ZIP_SOURCE_CLOSE:
        case ZIP_SOURCE_FREE:
            return 0;
        case ZIP_SOURCE_STAT: {
            auto * const stat = static_cast<zip_stat_t *>(data);
            zip_stat_init(stat);
            stat->size = entry.m_Size;
            stat->comp_size = entry.m_Bytes->GetSize();
            stat->comp_method = entry.m_Deflated ? ZIP_CM_DEFLATE : ZIP_CM_STORE;
            stat->crc = entry.m_Checksum;
            stat->valid = ZIP_STAT_SIZE | ZIP_STAT_COMP_SIZE | ZIP_STAT_COMP_METHOD | ZIP_STAT_CRC;
            return sizeof(*stat);
        }
        case ZIP_SOURCE_ERROR:
            std::memset(data, 0, 2 * sizeof(int));
            return 2 * sizeof(int);
        case ZIP_SOURCE_SUPPORTS:
            return ZIP_SOURCE_SUPPORTS_READABLE;
        default:
            return -1;
        }
    }
};

void Archive::Writer::Add(String const & name, int deflateLevel, Counted<RawData const> data)
{
    KORVANE_ASSERT_MESSAGE(
        std::none_of(m_Entries.begin(), m_Entries.end(), [&name](Entry const & entry) { return entry.m_Name == name; }),
        "an item of this name is in the archive already");
    std::uint64_t const size = data->GetSize();
    std::uint32_t const checksum = libdeflate_crc32(0, data->GetData(), data->GetSize());
    Counted<RawData const> const deflated = Deflate(deflateLevel, *data);
    m_Entries.push_back({name, deflated ? deflated : data, size, checksum, static_cast<bool>(deflated)});
}

void Archive::Writer::Write(IDTag type)
{
    std::string const typeText = ArchiveFormat::TypeText(type);
    auto const typeData = MakeCounted<RawData>(RawData::Bytes(typeText.begin(), typeText.end()));
    m_Entries.push_front({String(ArchiveFormat::TypeEntry), typeData, typeText.size(),
                          libdeflate_crc32(0, typeText.data(), typeText.size()), false});

    // Shares the file, and gives it back when libzip is done.
    ZipFileSource target(std::shared_ptr<File>(&m_File->GetFile(), [](File *) {}));
    zip_error_t error;
    zip_error_init(&error);
    zip_source_t * const source = target.MakeSource();
    zip_t * const container = source ? zip_open_from_source(source, ZIP_CREATE | ZIP_TRUNCATE, &error) : nullptr;
    bool done = container != nullptr;
    if (!container) {
        zip_source_free(source);
    }
    for (Entry & entry : m_Entries) {
        if (!done) {
            break;
        }
        zip_source_t * const content = zip_source_function_create(&ArchiveEntrySource::Call, &entry, &error);
        zip_int64_t const index =
            content ? zip_file_add(container, entry.m_Name.c_str(), content, ZIP_FL_ENC_UTF_8) : -1;
        if (index < 0) {
            zip_source_free(content);
            done = false;
            break;
        }
        auto const at = static_cast<zip_uint64_t>(index);
        done = zip_file_set_dostime(container, at, DosTime, DosDate, 0) == 0 &&
               (entry.m_Deflated || zip_set_file_compression(container, at, ZIP_CM_STORE, 0) == 0);
    }
    String message;
    if (container && (!done || zip_close(container) != 0)) {
        message = zip_strerror(container);
        zip_discard(container);
        done = false;
    }
    zip_error_fini(&error);
    target.ThrowFailure();
    if (!done) {
        throw FileIOException(FileIOException::Reason::WriteFailed, m_File->GetTarget(),
                              Format(LocalisedString("Cannot write %1: %2.", "File"), m_File->GetTarget(), message));
    }
}

void Archive::Writer::Verify(IDTag type) const
{
    OpenResult result{};
    auto const reader = Reader::Open(std::shared_ptr<File>(&m_File->GetFile(), [](File *) {}), type, result);
    if (!reader) {
        throw ArchiveCorruptionException(
            m_File->GetTarget(), LocalisedString("directory", "Damage"),
            LocalisedString("what was written cannot be read back", "Damage"));
    }
    for (Entry const & entry : m_Entries) {
        if (entry.m_Name == ArchiveFormat::TypeEntry) {
            continue;
        }
        Reader::Item const * const item = reader->Find(entry.m_Name);
        if (!item || item->m_Checksum != entry.m_Checksum ||
            reader->Read(entry.m_Name, *item)->GetSize() != entry.m_Size) {
            throw ArchiveCorruptionException(m_File->GetTarget(), entry.m_Name,
                                             LocalisedString("what was read back is not what was written", "Damage"));
        }
    }
}

}
