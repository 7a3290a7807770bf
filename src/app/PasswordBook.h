#pragma once

#include <functional>
#include <map>
#include <mutex>
#include <string>
#include <vector>

namespace App
{

/// The passwords of protected files that chapters place: from the command line, from a file, or typed by the user, who is
/// asked once for each file. Kept in memory for the length of the process, in no message and in no file. Safe on any
/// thread; one question at a time.
class PasswordBook
{
public:
    /// Asks the user without showing what is typed; false if nobody answers.
    using AskSecret = std::function<bool(std::string const & question, std::string & answer)>;

    /// "FILE=PASSWORD". FILE is a path, or the last parts of one. False if it is not of that form.
    [[nodiscard]] bool AddLine(std::string const & line);
    /// A file with such a line for each password; empty lines and those that begin with "#" are passed by. False with a
    /// sentence in `problem` that never shows a password.
    [[nodiscard]] bool ReadFile(std::string const & path, std::string & problem);
    void SetAsk(AskSecret ask) { m_Ask = std::move(ask); }

    /// The password of a file by its path; empty if none is known and nobody gives one. With `isWrong` the one given
    /// before did not open it, and the user is asked anew, if there is one.
    [[nodiscard]] std::string Find(std::string const & path, bool isWrong);

private:
    static constexpr int MostAttempts = 3;

    std::mutex m_Lock;
    AskSecret m_Ask;
    std::vector<std::pair<std::string, std::string>> m_Given;
    /// What the user typed, by path; empty: nothing.
    std::map<std::string, std::string> m_Typed;
    std::map<std::string, int> m_Attempts;
};

/// Overwrites the passwords in a program's arguments, which other users can read, with stars.
void HidePasswords(int count, char ** arguments);

}
