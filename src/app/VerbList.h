#pragma once

#include "app/Verbs.h"

#include <CLI/CLI.hpp>
#include <functional>

namespace App
{

/// Check for an option that takes whole numbers.
[[nodiscard]] std::function<std::string(std::string const &)> NumberBetween(long long least, long long most);
/// Check for an option that takes one of a few words.
[[nodiscard]] std::function<std::string(std::string const &)> OneOfWords(std::vector<std::string> words);

/// The verbs as the command line knows them. Each verb's source adds its own, with its options; what the options say
/// lies in a value that the verb's runner holds.
class VerbList
{
public:
    using Runner = std::function<int(VerbContext &)>;

    explicit VerbList(CLI::App & program);

    /// A new verb with the options that every verb has. `example` is the text below its help.
    CLI::App & Add(std::string const & name, std::string const & purpose, std::string const & example, Runner run);
    /// Options that answer the questions which opening documents may raise.
    void AddAnswers(CLI::App & verb);
    /// Options that give the passwords of protected files; part of `AddAnswers`.
    void AddPasswords(CLI::App & verb);
    /// Option for the moment that stands for now in the output; `time` stays as it is without it.
    void AddFixedTime(CLI::App & verb, long long & time);

    /// Makes an empty value wrong use, wherever it would stand for a name: scripts give one where a variable has no value.
    void RefuseEmptyValues();

    /// Runs the verb that the arguments named.
    int RunParsed(VerbContext & context) const;
    [[nodiscard]] ConsoleSettings const & Settings() const { return m_Settings; }
    [[nodiscard]] StandingAnswers const & Answers() const { return m_Answers; }

private:
    CLI::App & m_Program;
    std::vector<std::pair<CLI::App *, Runner>> m_Runners;
    ConsoleSettings m_Settings;
    StandingAnswers m_Answers;
};

}
