#include "framework/kernel/Entropy.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/CriticalSection.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <sys/random.h>

namespace Kernel
{

namespace
{

struct FixedSequence
{
    CriticalSection m_Lock;
    bool m_Fixed KORVANE_GUARDED_BY(m_Lock) = false;
    std::uint64_t m_State KORVANE_GUARDED_BY(m_Lock) = 0;
};

FixedSequence & Sequence()
{
    static FixedSequence sequence;
    return sequence;
}

/// SplitMix64 (Steele, Lea and Flood, 2014): every seed gives a full-period sequence.
std::uint64_t Next(std::uint64_t & state)
{
    std::uint64_t z = state += 0x9E3779B97F4A7C15ULL;
    z = (z ^ z >> 30) * 0xBF58476D1CE4E5B9ULL;
    z = (z ^ z >> 27) * 0x94D049BB133111EBULL;
    return z ^ z >> 31;
}

}

void Entropy::Fill(void * buffer, std::size_t size)
{
    auto * target = static_cast<unsigned char *>(buffer);
    FixedSequence & sequence = Sequence();
    {
        ScopedLock lock(sequence.m_Lock);
        if (sequence.m_Fixed) {
            for (std::size_t at = 0; at < size; at += sizeof(std::uint64_t)) {
                std::uint64_t const word = Next(sequence.m_State);
                std::memcpy(target + at, &word, std::min(sizeof(word), size - at));
            }
            return;
        }
    }
    while (0 < size) {
        ssize_t const got = ::getrandom(target, size, 0);
        KORVANE_ASSERT(0 < got || errno == EINTR);
        if (0 < got) {
            target += got;
            size -= static_cast<std::size_t>(got);
        }
    }
}

void Entropy::FixSequence(std::uint64_t seed)
{
    FixedSequence & sequence = Sequence();
    ScopedLock lock(sequence.m_Lock);
    sequence.m_Fixed = true;
    sequence.m_State = seed;
}

void Entropy::ReleaseSequence()
{
    FixedSequence & sequence = Sequence();
    ScopedLock lock(sequence.m_Lock);
    sequence.m_Fixed = false;
}

}
