#pragma once

#include <cstdint>

namespace Kernel
{

/// What is going on in the process: commands queued or running, notifications undelivered, dirty background tasks that
/// will run. Everything that starts something counts itself in before it returns and out when its effects are all
/// counted in themselves, so that "nothing" is never seen in between. Safe on any thread.
class Activity
{
public:
    static void Begin();
    static void End();
    /// A question has come before the user, or has been answered.
    static void BeginQuestion();
    static void EndQuestion();

    enum class Rest
    {
        Idle,
        WaitingForUser
    };
    /// Returns when nothing is going on, or at once when a question is before the user and nobody has answered. While
    /// somebody waits here, dirty tasks fire without keeping their interval. Not for a thread that works a queue.
    static Rest WaitForRest();
    /// Somebody is in `WaitForRest`.
    [[nodiscard]] static bool IsAwaited();

    /// Things going on at this moment, for diagnostics.
    [[nodiscard]] static std::int64_t GetCount();
};

}
