#pragma once

#include <atomic>

namespace App
{

/// Ctrl-C and the polite end signals, for as long as this lives: they raise a flag that the work polls. A second signal
/// ends the program at once. One object at a time.
class Interruption
{
public:
    Interruption();
    ~Interruption();
    Interruption(Interruption const &) = delete;
    Interruption & operator=(Interruption const &) = delete;

    [[nodiscard]] static bool IsRaised();
    /// The flag itself, for code that takes a pointer.
    [[nodiscard]] static std::atomic<bool> const * Flag();
    /// As if the user had pressed Ctrl-C.
    static void Raise();
};

}
