#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/RawData.h"
#include "framework/kernel/StringT.h"

#include <cstddef>
#include <cstdint>

namespace Kernel
{

/// A sequence of bytes that can be read, from a file, from memory or from an item of an archive. One thread at a time.
class InStream : public virtual Countable
{
public:
    /// Reads up to `size` bytes; fewer only at the end of the stream. Throws `FileIOException`.
    virtual std::size_t Read(void * buffer, std::size_t size) = 0;
    [[nodiscard]] virtual std::uint64_t GetLength() const = 0;
    [[nodiscard]] virtual std::uint64_t GetPosition() const = 0;
    /// Moves to an offset that is at most the length.
    virtual void Seek(std::uint64_t offset) = 0;
    /// The path of the file it comes from, for messages; empty for memory.
    [[nodiscard]] virtual String GetSourceName() const = 0;

    /// The rest of the stream, from the present position to the end. The block is shared where the stream lies in
    /// memory as a whole and nothing has been read yet, and copied otherwise.
    [[nodiscard]] virtual Counted<RawData const> ReadAll();
};

}
