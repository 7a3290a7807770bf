#pragma once

#include <string>

namespace CLI
{
class App;
class ParseError;
}

namespace App
{

/// What is wrong with a command line, in the user's language. The library that reads it knows English alone.
[[nodiscard]] std::string DescribeWrongUse(CLI::App const & program, CLI::ParseError const & error);

}
