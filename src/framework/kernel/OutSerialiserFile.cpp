#include "framework/kernel/OutSerialiserFile.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/TaggedStreamFormat.h"

namespace Kernel
{

using namespace TaggedStream;

OutSerialiserFile::OutSerialiserFile(OutStream & stream, FileStoreOut & store, IDTag rootTag, unsigned short version)
    : OutSerialiser(store, nullptr),
      m_Stream(stream),
      m_RootTag(rootTag),
      m_Version(version)
{
}

void OutSerialiserFile::Close()
{
    KORVANE_ASSERT(!m_Closed && IsBalanced());
    m_Closed = true;
    if (!IsFullSave()) {
        return;
    }
    std::uint8_t header[StreamHeaderSize] = {};
    std::memcpy(header, Magic, sizeof(Magic));
    std::memcpy(header + 4, &FormatVersion, sizeof(FormatVersion));
    std::memcpy(header + 6, &m_Version, sizeof(m_Version));
    for (int i = 0; i < 4; ++i) {
        header[8 + i] = static_cast<std::uint8_t>(m_RootTag.Value() >> (24 - 8 * i));
    }
    std::uint64_t const length = GetBytes().size();
    std::memcpy(header + 16, &length, sizeof(length));
    m_Stream.Write(header, sizeof(header));
    m_Stream.Write(GetBytes().data(), GetBytes().size());
}

OutSerialiserMemory::OutSerialiserMemory(FileStoreOut & store, CompareContext const * context)
    : OutSerialiser(store, context)
{
}

std::vector<std::uint8_t> const & OutSerialiserMemory::WriteWhole(Serialisable const & object)
{
    WriteObject(object);
    return GetBytes();
}

}
