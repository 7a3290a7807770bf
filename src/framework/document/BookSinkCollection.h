#pragma once

#include "framework/document/BookSink.h"

#include <functional>

/// The registered book sinks. Sinks are not owned. Safe on any thread; a sink is not called any more once
/// `UnregisterBookSink` has returned.
class BookSinkCollection
{
public:
    static void RegisterBookSink(BookSink * sink);
    static void UnregisterBookSink(BookSink * sink);

    /// Asks the sinks in the order of registration until `ask` returns true; that is the result, false if none did.
    static bool Ask(std::function<bool(BookSink &)> const & ask);
};
