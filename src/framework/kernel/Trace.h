#pragma once

#include "framework/kernel/StringT.h"

#include <functional>

namespace Kernel
{

/// Writes a diagnostic line, which the user never sees. It goes to the standard error stream if the environment
/// variable KORVANE_TRACE is set, and nowhere otherwise. Safe on any thread; lines do not mix.
void Trace(char const * line);
void Trace(String const & line);

/// Sends the lines to a function instead; an empty one undoes that. For tests and for log files. The function may be
/// called on any thread, on one at a time.
void SetTraceTarget(std::function<void(String const &)> target);

/// Somebody is listening: worth asking before a line is put together at some cost.
[[nodiscard]] bool IsTraceOn();

}
