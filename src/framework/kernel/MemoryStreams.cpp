#include "framework/kernel/MemoryStreams.h"

#include "framework/kernel/Assert.h"

#include <algorithm>
#include <cstring>

namespace Kernel
{

MemoryInStream::MemoryInStream(Counted<RawData const> data, String sourceName)
    : m_Data(std::move(data)),
      m_SourceName(std::move(sourceName))
{
    KORVANE_ASSERT(m_Data);
}

std::size_t MemoryInStream::Read(void * buffer, std::size_t size)
{
    std::size_t const taken = std::min(size, m_Data->GetSize() - m_Position);
    if (0 < taken) {
        std::memcpy(buffer, m_Data->GetData() + m_Position, taken);
        m_Position += taken;
    }
    return taken;
}

void MemoryInStream::Seek(std::uint64_t offset)
{
    KORVANE_ASSERT(offset <= m_Data->GetSize());
    m_Position = static_cast<std::size_t>(offset);
}

Counted<RawData const> MemoryInStream::ReadAll()
{
    if (m_Position != 0) {
        return InStream::ReadAll();
    }
    m_Position = m_Data->GetSize();
    return m_Data;
}

void MemoryOutStream::Write(void const * data, std::size_t size)
{
    auto const * const bytes = static_cast<std::uint8_t const *>(data);
    m_Bytes.insert(m_Bytes.end(), bytes, bytes + size);
}

Counted<RawData> MemoryOutStream::RelinquishOwnership()
{
    auto data = MakeCounted<RawData>(std::move(m_Bytes));
    m_Bytes.clear();
    return data;
}

}
