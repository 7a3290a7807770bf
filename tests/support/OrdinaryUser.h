#pragma once

#include <string>

/// For tests of permissions, which do not bind the superuser. Where the test runs as that one, runs the same test again
/// in a process of an ordinary user, fails it if that fails, and gives true: the caller returns. Skips it where the build is
/// closed to ordinary users. False for an ordinary user, who goes on.
[[nodiscard]] bool RanAsOrdinaryUser();

/// Starts this test program again for one test, switched-off ones included, with a variable in its environment. Gives
/// the process.
[[nodiscard]] int StartTestProgram(std::string const & test, std::string const & variable, bool asOrdinaryUser);
/// Waits for it; true if its test ran and passed.
[[nodiscard]] bool HasPassed(int process);
