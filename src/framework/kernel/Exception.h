#pragma once

#include "framework/kernel/StringT.h"

#include <exception>

namespace Kernel
{

/// Base of what the file layer throws: a sentence that a user can act on, with the file and the place in it where there
/// is one.
class Exception : public std::exception
{
public:
    explicit Exception(String message) : m_Message(std::move(message)) {}

    [[nodiscard]] String const & GetMessage() const { return m_Message; }
    [[nodiscard]] char const * what() const noexcept override { return m_Message.c_str(); }

private:
    String m_Message;
};

}
