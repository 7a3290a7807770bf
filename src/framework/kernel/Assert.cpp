#include "framework/kernel/Assert.h"

#include <cstdio>
#include <cstdlib>

namespace Kernel
{

void AssertionFailed(char const * condition, char const * message, char const * file, int line)
{
    std::fprintf(stderr, "%s:%d: assertion failed: %s %s\n", file, line, condition, message);
    std::abort();
}

}
