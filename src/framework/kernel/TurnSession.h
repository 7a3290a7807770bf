#pragma once

#include "framework/kernel/Counted.h"

#include <vector>

namespace Kernel
{

/// Keeps what getters hand out by reference or pointer.
///
/// Lists, tables and cached facts that others replace while they are read are immutable snapshots. A getter that gives
/// out a reference into one passes the snapshot to `Keep`, and it stays to the end of the calling turn. Each turn of a
/// queue and each delivery has a session; other threads open one of their own around such reads. Sessions nest.
class TurnSession
{
public:
    TurnSession();
    ~TurnSession();
    TurnSession(TurnSession const &) = delete;
    TurnSession & operator=(TurnSession const &) = delete;

    /// Keeps the object to the end of the thread's innermost session; there has to be one. Null is allowed.
    static void Keep(Counted<Countable const> object);
    /// The calling thread has a session.
    [[nodiscard]] static bool IsOpen();

private:
    TurnSession * const m_Outer;
    std::vector<Counted<Countable const>> m_Kept;
};

}
