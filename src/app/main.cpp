#include "app/Language.h"
#include "app/PasswordBook.h"
#include "app/Verbs.h"

#include <cstdlib>
#include <fcntl.h>
#include <iostream>
#include <poll.h>
#include <string_view>
#include <sys/ioctl.h>
#include <unistd.h>

namespace
{

bool AskOnTerminal(std::string const & question, std::string & answer)
{
    std::cerr << question << ' ' << std::flush;
    return static_cast<bool>(std::getline(std::cin, answer));
}

/// A program may be started with its streams closed. The first files that it opens would then take their places, and get
/// what is meant for the user written into them. What stands in for a stream refuses, as a closed one does.
void FillClosedStreams()
{
    for (int const stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
        if (fcntl(stream, F_GETFD) < 0) {
            // The lowest number that is free, which is this one.
            static_cast<void>(open("/dev/null", STDIN_FILENO == stream ? O_WRONLY : O_RDONLY));
        }
    }
}

bool HasReader()
{
    pollfd output{STDOUT_FILENO, POLLOUT, 0};
    return !(0 < poll(&output, 1, 0) && (output.revents & POLLERR));
}

int ColumnsOf(int stream)
{
    winsize size{};
    return 0 == ioctl(stream, TIOCGWINSZ, &size) && 0 < size.ws_col ? size.ws_col : 80;
}

App::TerminalFacts LookAtTerminal()
{
    App::TerminalFacts facts;
    facts.m_HasProgress = isatty(STDERR_FILENO);
    facts.m_HasReader = &HasReader;
    facts.m_ProgressColumns = ColumnsOf(STDERR_FILENO);
    if (isatty(STDOUT_FILENO)) {
        // no-color.org: any value but an empty one.
        char const * const noColour = std::getenv("NO_COLOR");
        char const * const kind = std::getenv("TERM");
        facts.m_HasColour = !(noColour && *noColour) && kind && std::string_view(kind) != "dumb";
        facts.m_Columns = ColumnsOf(STDOUT_FILENO);
    }
    return facts;
}

}

int main(int argc, char ** argv)
{
    FillClosedStreams();
    App::ChooseLanguage();
    bool const canAsk = isatty(STDIN_FILENO) && isatty(STDERR_FILENO);
    std::vector<std::string> const arguments(argv + 1, argv + argc);
    App::HidePasswords(argc, argv);
    return App::RunProgram(arguments, std::cout, std::cerr, LookAtTerminal(),
                           canAsk ? App::AskUser(&AskOnTerminal) : nullptr);
}
