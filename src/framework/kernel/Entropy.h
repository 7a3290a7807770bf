#pragma once

#include <cstddef>
#include <cstdint>

namespace Kernel
{

/// Where random bytes come from: the system's generator, unless a test has fixed the sequence.
class Entropy
{
public:
    /// Fills the buffer. Safe on any thread.
    static void Fill(void * buffer, std::size_t size);

    /// From now on the bytes are a sequence that follows from the seed alone, for output that is to be the same each
    /// time. Not fit to keep a secret.
    static void FixSequence(std::uint64_t seed);
    /// Back to the system's generator.
    static void ReleaseSequence();
};

}
