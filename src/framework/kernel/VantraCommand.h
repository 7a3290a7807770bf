#pragma once

#include "framework/kernel/Command.h"

/// A command of the application as a whole, tied to no domain. Runs on the application's queue, in turn, with no lock.
/// That queue serves everybody: a command on it waits neither for a book nor for a document.
class VantraCommand : public Command
{
};

/// One that is run at once, on the thread that hands it in, and is over when that call returns. It may wait.
class ImmediateVantraCommand : public VantraCommand
{
};
