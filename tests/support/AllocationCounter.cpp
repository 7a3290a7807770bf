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

// All forms without an alignment, so that each `delete` meets the `new` that it belongs to, also where a sanitizer has its
// own of those that are left out.
void * operator new(std::size_t size, std::nothrow_t const &) noexcept
{
    ++t_Allocations;
    return std::malloc(size == 0 ? 1 : size);
}

void * operator new(std::size_t size)
{
    if (void * const memory = operator new(size, std::nothrow)) {
        return memory;
    }
    throw std::bad_alloc();
}

void * operator new[](std::size_t size)
{
    return operator new(size);
}

void * operator new[](std::size_t size, std::nothrow_t const &) noexcept
{
    return operator new(size, std::nothrow);
}

void operator delete(void * memory) noexcept
{
    std::free(memory);
}

void operator delete(void * memory, std::size_t) noexcept
{
    std::free(memory);
}

void operator delete(void * memory, std::nothrow_t const &) noexcept
{
    std::free(memory);
}

void operator delete[](void * memory) noexcept
{
    std::free(memory);
}

void operator delete[](void * memory, std::size_t) noexcept
{
    std::free(memory);
}

void operator delete[](void * memory, std::nothrow_t const &) noexcept
{
    std::free(memory);
}
