#include "app/Verbs.h"

#include <clocale>
#include <iostream>
#include <unistd.h>

namespace
{

bool AskOnTerminal(std::string const & question, std::string & answer)
{
    std::cerr << question << ' ' << std::flush;
    return static_cast<bool>(std::getline(std::cin, answer));
}

}

int main(int argc, char ** argv)
{
    std::setlocale(LC_MESSAGES, "");
    bool const canAsk = isatty(STDIN_FILENO) && isatty(STDERR_FILENO);
    std::vector<std::string> const arguments(argv + 1, argv + argc);
    return App::RunProgram(arguments, std::cout, std::cerr, isatty(STDERR_FILENO),
                           canAsk ? App::AskUser(&AskOnTerminal) : nullptr);
}
