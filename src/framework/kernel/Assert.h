#pragma once

namespace Kernel
{

/// Prints the condition and its place to the standard error stream and ends the program.
[[noreturn]] void AssertionFailed(char const * condition, char const * message, char const * file, int line);

}

/// A programming mistake, never a user's: on in every build but those that define KORVANE_FASTEST.
#ifdef KORVANE_FASTEST
#define KORVANE_ASSERT(condition) static_cast<void>(0)
#define KORVANE_ASSERT_MESSAGE(condition, message) static_cast<void>(0)
#else
#define KORVANE_ASSERT(condition)                                                                                      \
    ((condition) ? static_cast<void>(0) : ::Kernel::AssertionFailed(#condition, "", __FILE__, __LINE__))
#define KORVANE_ASSERT_MESSAGE(condition, message)                                                                     \
    ((condition) ? static_cast<void>(0) : ::Kernel::AssertionFailed(#condition, message, __FILE__, __LINE__))
#endif
