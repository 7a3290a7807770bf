#include "support/AllocationCounter.h"

#include <cstdlib>
#include <new>

namespace
{

thread_local std::uint64_t t_Allocations = 0;

}

std::uint64_t CountAllocations()
{
    return t_Allocations;
}

// The forms for arrays, and those that do not throw, come down to these.
void * operator new(std::size_t size)
{
    ++t_Allocations;
    if (void * const memory = std::malloc(size == 0 ? 1 : size)) {
        return memory;
    }
    throw std::bad_alloc();
}

void operator delete(void * memory) noexcept
{
    std::free(memory);
}

void operator delete(void * memory, std::size_t) noexcept
{
    std::free(memory);
}
