#pragma once

#include <functional>
#include <optional>

/// Runs `work` in a forked process and gives its result, or none, with a test failure, if it ended in another way. The
/// result has to be between 0 and 199. The process ends by itself after some seconds, so that none is left behind.
[[nodiscard]] std::optional<int> RunInChild(std::function<int()> const & work);

/// The same as a user without rights, where the tests run with all of them; where they don't, as the user that runs them.
[[nodiscard]] std::optional<int> RunAsPlainUser(std::function<int()> const & work);

/// A process that has done `work` and holds what that took, such as locks, until the object goes.
class HoldingChild
{
public:
    /// `work` gives what is to be kept: it lives as long as the process.
    explicit HoldingChild(std::function<std::function<void()>()> const & work);
    ~HoldingChild();
    HoldingChild(HoldingChild const &) = delete;
    HoldingChild & operator=(HoldingChild const &) = delete;

private:
    int m_Process = -1;
    int m_Pipe[2] = {-1, -1};
};
