#include "support/OrdinaryUser.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <grp.h>
#include <pwd.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

namespace
{

/// The program can't be run by others, or there is no such user.
constexpr int CannotStart = 77;
/// What the dynamic linker ends with where it may not read the libraries.
constexpr int CannotLink = 127;

int StatusOf(int process)
{
    int status = 0;
    while (waitpid(process, &status, 0) < 0 && errno == EINTR) {
    }
    return status;
}

}

int StartTestProgram(std::string const & test, std::string const & variable, bool asOrdinaryUser)
{
    passwd const * const nobody = asOrdinaryUser ? getpwnam("nobody") : nullptr;
    std::string const filter = "--gtest_filter=" + test;
    std::vector<char const *> const arguments{"test", filter.c_str(), "--gtest_also_run_disabled_tests",
                                              "--gtest_brief=1", nullptr};
    std::vector<char const *> environment{variable.c_str()};
    for (char ** entry = environ; *entry; ++entry) {
        environment.push_back(*entry);
    }
    environment.push_back(nullptr);
    pid_t const process = fork();
    if (process == 0) {
        // Between fork and exec only what is safe beside other threads.
        if (asOrdinaryUser && (!nobody || setgid(nobody->pw_gid) != 0 || setuid(nobody->pw_uid) != 0)) {
            _exit(CannotStart);
        }
        execve("/proc/self/exe", const_cast<char **>(arguments.data()), const_cast<char **>(environment.data()));
        _exit(CannotStart);
    }
    return process;
}

bool HasPassed(int process)
{
    int const status = StatusOf(process);
    return WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

bool RanAsOrdinaryUser()
{
    if (geteuid() != 0) {
        return false;
    }
    testing::TestInfo const & test = *testing::UnitTest::GetInstance()->current_test_info();
    int const status = StatusOf(StartTestProgram(std::string(test.test_suite_name()) + "." + test.name(),
                                                 "KORVANE_TEST_USER=nobody", true));
    if (WIFEXITED(status) && (WEXITSTATUS(status) == CannotStart || WEXITSTATUS(status) == CannotLink)) {
        [] { GTEST_SKIP() << "the build lies in a folder that is closed to ordinary users"; }();
        return true;
    }
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << "see what the ordinary user's process has printed";
    return true;
}
