#pragma once

#include "framework/kernel/Exception.h"

/// A command can't be done on this document. The message is a sentence for the user; nothing has been changed.
class CommandException : public Kernel::Exception
{
public:
    using Kernel::Exception::Exception;
};
