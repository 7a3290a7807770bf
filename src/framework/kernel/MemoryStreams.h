#pragma once

#include "framework/kernel/InStream.h"
#include "framework/kernel/OutStream.h"

#include <vector>

namespace Kernel
{

/// Reads a shared block of memory.
class MemoryInStream : public InStream
{
public:
    /// `sourceName` is what messages call it, such as the path of the archive that the block comes from.
    MemoryInStream(Counted<RawData const> data, String sourceName);

    std::size_t Read(void * buffer, std::size_t size) override;
    [[nodiscard]] std::uint64_t GetLength() const override { return m_Data->GetSize(); }
    [[nodiscard]] std::uint64_t GetPosition() const override { return m_Position; }
    void Seek(std::uint64_t offset) override;
    [[nodiscard]] String GetSourceName() const override { return m_SourceName; }
    [[nodiscard]] Counted<RawData const> ReadAll() override;

private:
    Counted<RawData const> const m_Data;
    String const m_SourceName;
    std::size_t m_Position = 0;
};

/// Gathers what is written in memory.
class MemoryOutStream : public OutStream
{
public:
    void Write(void const * data, std::size_t size) override;
    [[nodiscard]] std::uint64_t GetPosition() const override { return m_Bytes.size(); }

    [[nodiscard]] std::vector<std::uint8_t> const & GetBytes() const { return m_Bytes; }
    /// Gives the bytes away; the stream is empty afterwards.
    [[nodiscard]] Counted<RawData> RelinquishOwnership();

private:
    std::vector<std::uint8_t> m_Bytes;
};

}
