#include "app/PasswordBook.h"

#include "import/Text.h"

#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string_view>

namespace App
{

using Import::Text;

namespace
{

/// `name` is the path itself, or its last parts.
bool Names(std::string const & name, std::string const & path)
{
    std::error_code error;
    return std::filesystem::absolute(name, error).lexically_normal() == path || path.ends_with("/" + name);
}

}

bool PasswordBook::AddLine(std::string const & line)
{
    std::size_t const mark = line.find('=');
    if (std::string::npos == mark || 0 == mark || line.size() == mark + 1) {
        return false;
    }
    std::lock_guard const lock(m_Lock);
    m_Given.emplace_back(line.substr(0, mark), line.substr(mark + 1));
    return true;
}

bool PasswordBook::ReadFile(std::string const & path, std::string & problem)
{
    // A pipe will do, but not one without an end.
    constexpr std::size_t largest = std::size_t(1) << 20;
    std::error_code error;
    std::ifstream stream(path);
    std::string text(largest + 1, '\0');
    stream.read(text.data(), static_cast<std::streamsize>(text.size()));
    if (!stream.is_open() || stream.bad() || std::filesystem::is_directory(path, error)) {
        problem = Text("The password file %1 can't be read.", "Program", path);
        return false;
    }
    text.resize(static_cast<std::size_t>(stream.gcount()));
    if (largest < text.size()) {
        problem = Text("The password file %1 is larger than any list of passwords.", "Program", path);
        return false;
    }
    int number = 0;
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);) {
        ++number;
        line.resize(line.ends_with('\r') ? line.size() - 1 : line.size());
        if (!line.empty() && '#' != line[0] && !AddLine(line)) {
            problem = Text("Line %2 of the password file %1 is not of the form FILE=PASSWORD.", "Program", path, number);
            return false;
        }
    }
    return true;
}

std::string PasswordBook::Find(std::string const & path, bool isWrong)
{
    std::lock_guard const lock(m_Lock);
    auto const typed = m_Typed.find(path);
    if (!isWrong && m_Typed.end() != typed) {
        return typed->second;
    }
    for (auto const & [name, password] : m_Given) {
        if (!isWrong && Names(name, path)) {
            return password;
        }
    }
    bool const isRefused = m_Typed.end() != typed && typed->second.empty();
    if (!m_Ask || isRefused || MostAttempts <= m_Attempts[path]++) {
        return {};
    }
    std::string answer;
    std::string const question =
        isWrong ? Text("That is not the password of %1. Password (empty for none):", "Program", path)
                : Text("The placed file %1 is protected. Password (empty for none):", "Program", path);
    if (!m_Ask(question, answer)) {
        answer.clear();
    }
    m_Typed[path] = answer;
    return answer;
}

void HidePasswords(int count, char ** arguments)
{
    constexpr std::string_view Option = "--password";
    for (int i = 1; i < count; ++i) {
        std::string_view const argument = arguments[i];
        if (argument == Option && i + 1 < count) {
            std::memset(arguments[i + 1], '*', std::strlen(arguments[i + 1]));
        } else if (argument.starts_with("--password=")) {
            std::memset(arguments[i] + Option.size() + 1, '*', argument.size() - Option.size() - 1);
        }
    }
}

}
