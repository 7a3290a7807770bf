#include "support/Child.h"

#include <grp.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

namespace
{

constexpr unsigned SecondsOfAChild = 60;
constexpr uid_t Nobody = 65534;

}

std::optional<int> RunInChild(std::function<int()> const & work)
{
    int const process = ::fork();
    if (process == 0) {
        ::alarm(SecondsOfAChild);
        ::_exit(work());
    }
    int status = 0;
    if (process < 0 || ::waitpid(process, &status, 0) != process || !WIFEXITED(status)) {
        ADD_FAILURE() << "the child process ended with status " << status;
        return std::nullopt;
    }
    return WEXITSTATUS(status);
}

std::optional<int> RunAsPlainUser(std::function<int()> const & work)
{
    constexpr int NotPossible = 201;
    std::optional<int> const result = RunInChild([&work] {
        if (::geteuid() == 0 &&
            (::setgroups(0, nullptr) != 0 || ::setresgid(Nobody, Nobody, Nobody) != 0 ||
             ::setresuid(Nobody, Nobody, Nobody) != 0)) {
            return NotPossible;
        }
        return work();
    });
    if (result == NotPossible) {
        ADD_FAILURE() << "no other user can be taken on here";
        return std::nullopt;
    }
    return result;
}

HoldingChild::HoldingChild(std::function<std::function<void()>()> const & work)
{
    int ready[2];
    if (::pipe(m_Pipe) != 0 || ::pipe(ready) != 0) {
        ADD_FAILURE() << "no pipe";
        return;
    }
    m_Process = ::fork();
    char byte = 0;
    if (m_Process == 0) {
        ::alarm(SecondsOfAChild);
        ::close(m_Pipe[1]);
        std::function<void()> const kept = work();
        static_cast<void>(::write(ready[1], &byte, 1));
        // Until the other end is closed.
        static_cast<void>(::read(m_Pipe[0], &byte, 1));
        ::_exit(0);
    }
    ::close(ready[1]);
    EXPECT_EQ(::read(ready[0], &byte, 1), 1) << "the child process has not got ready";
    ::close(ready[0]);
    ::close(m_Pipe[0]);
}

HoldingChild::~HoldingChild()
{
    ::close(m_Pipe[1]);
    ::waitpid(m_Process, nullptr, 0);
}
