#pragma once

#include "framework/kernel/Countable.h"

#include <cstddef>
#include <cstdint>

namespace Kernel
{

/// Takes a sequence of bytes. One thread at a time.
class OutStream : public virtual Countable
{
public:
    /// Takes all bytes, or fails in the way of its class.
    virtual void Write(void const * data, std::size_t size) = 0;
    /// Bytes written so far.
    [[nodiscard]] virtual std::uint64_t GetPosition() const = 0;
};

}
