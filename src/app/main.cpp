#include "app/Language.h"
#include "app/PasswordBook.h"
#include "app/Verbs.h"

#include <cstdlib>
#include <iostream>
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

App::TerminalFacts LookAtTerminal()
{
    App::TerminalFacts facts;
    facts.m_HasProgress = isatty(STDERR_FILENO);
    if (isatty(STDOUT_FILENO)) {
        // no-color.org: any value but an empty one.
        char const * const noColour = std::getenv("NO_COLOR");
        char const * const kind = std::getenv("TERM");
        facts.m_HasColour = !(noColour && *noColour) && kind && std::string_view(kind) != "dumb";
        winsize size{};
        facts.m_Columns = 0 == ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) && 0 < size.ws_col ? size.ws_col : 80;
    }
    return facts;
}

}

int main(int argc, char ** argv)
{
    App::ChooseLanguage();
    bool const canAsk = isatty(STDIN_FILENO) && isatty(STDERR_FILENO);
    std::vector<std::string> const arguments(argv + 1, argv + argc);
    App::HidePasswords(argc, argv);
    return App::RunProgram(arguments, std::cout, std::cerr, LookAtTerminal(),
                           canAsk ? App::AskUser(&AskOnTerminal) : nullptr);
}
