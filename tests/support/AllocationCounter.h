#pragma once

#include <cstdint>

/// How often the calling thread has asked for memory by `new` since it began. A program that uses this has its own global
/// `operator new`.
[[nodiscard]] std::uint64_t CountAllocations();
