#include "app/Interruption.h"

#include <csignal>
#include <unistd.h>

namespace App
{

namespace
{

std::atomic<bool> g_IsRaised = false;
static_assert(std::atomic<bool>::is_always_lock_free, "a signal handler may touch nothing that locks");

void OnSignal(int signal)
{
    if (g_IsRaised.exchange(true)) {
        _exit(128 + signal);
    }
}

}

Interruption::Interruption()
{
    g_IsRaised = false;
    struct sigaction action
    {
    };
    action.sa_handler = &OnSignal;
    sigemptyset(&action.sa_mask);
    for (int const signal : {SIGINT, SIGTERM, SIGHUP}) {
        sigaction(signal, &action, nullptr);
    }
    // Writing into a closed pipe, or beyond the user's limit on file sizes, is an error to report, not a reason to die
    // half-way.
    std::signal(SIGPIPE, SIG_IGN);
    std::signal(SIGXFSZ, SIG_IGN);
}

Interruption::~Interruption()
{
    for (int const signal : {SIGINT, SIGTERM, SIGHUP}) {
        std::signal(signal, SIG_DFL);
    }
}

bool Interruption::IsRaised()
{
    return g_IsRaised;
}

std::atomic<bool> const * Interruption::Flag()
{
    return &g_IsRaised;
}

void Interruption::Raise()
{
    g_IsRaised = true;
}

}
