#include "app/VerbList.h"

#include "import/Text.h"

#include <algorithm>
#include <charconv>
#include <limits>

namespace App
{

using Import::Text;

std::function<std::string(std::string const &)> NumberBetween(long long least, long long most)
{
    return [least, most](std::string const & text) {
        long long number = 0;
        auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
        bool const isGood =
            std::errc() == error && text.data() + text.size() == end && least <= number && number <= most;
        if (isGood) {
            return std::string();
        }
        return std::numeric_limits<long long>::max() == most
                   ? Text("\"%1\" is no whole number from %2 on.", "Wrong use", text, least)
                   : Text("\"%1\" is no whole number from %2 to %3.", "Wrong use", text, least, most);
    };
}

std::function<std::string(std::string const &)> OneOfWords(std::vector<std::string> words)
{
    return [words = std::move(words)](std::string const & text) {
        if (words.end() != std::find(words.begin(), words.end(), text)) {
            return std::string();
        }
        std::string known;
        for (std::string const & word : words) {
            known += (known.empty() ? "" : ", ") + word;
        }
        return Text("\"%1\" is not one of %2.", "Wrong use", text, known);
    };
}

VerbList::VerbList(CLI::App & program) : m_Program(program)
{
    m_Answers.m_Passwords = std::make_shared<PasswordBook>();
}

CLI::App & VerbList::Add(std::string const & name, std::string const & purpose, std::string const & example, Runner run)
{
    CLI::App & verb = *m_Program.add_subcommand(name, purpose);
    verb.group(Text("Verbs", "Help"));
    verb.set_help_flag("-h,--help", Text("Print this help and end", "Help"));
    verb.add_flag("--json", m_Settings.m_IsJson, Text("Give the result as one JSON document", "Help"));
    verb.add_flag("--quiet,-q", m_Settings.m_IsQuiet, Text("Say nothing but errors", "Help"));
    verb.footer(Text("Example:", "Help") + "\n" + example);
    m_Runners.emplace_back(&verb, std::move(run));
    return verb;
}

void VerbList::AddAnswers(CLI::App & verb)
{
    auto const set = [](StandingAnswers::Choice & choice, StandingAnswers::Choice value) {
        return [&choice, value](std::int64_t) { choice = value; };
    };
    using Choice = StandingAnswers::Choice;
    verb.add_flag_function("--upgrade", set(m_Answers.m_Upgrade, Choice::Yes),
                           Text("Bring documents of an older version up to date", "Help"));
    verb.add_flag_function("--no-upgrade", set(m_Answers.m_Upgrade, Choice::No),
                           Text("Leave out documents of an older version", "Help"));
    verb.add_flag_function("--locate", set(m_Answers.m_Locate, Choice::Yes),
                           Text("Look for chapters whose files are gone", "Help"));
    verb.add_flag_function("--no-locate", set(m_Answers.m_Locate, Choice::No),
                           Text("Go on without chapters whose files are gone", "Help"));
    AddPasswords(verb);
}

void VerbList::AddPasswords(CLI::App & verb)
{
    PasswordBook & book = *m_Answers.m_Passwords;
    verb.add_option_function<std::vector<std::string>>(
            "--password",
            [&book](std::vector<std::string> const & lines) {
                for (std::string const & line : lines) {
                    if (!book.AddLine(line)) {
                        // Without the value, which may be a secret.
                        throw CLI::ValidationError("--password", Text("needs the form FILE=PASSWORD", "Help"));
                    }
                }
            },
            Text("Password of a protected PDF that a chapter places; may be given again for others", "Help"))
        ->type_name(Text("FILE=PASSWORD", "Help"))
        ->type_size(1)
        ->expected(1)
        ->take_all();
    verb.add_option_function<std::string>(
            "--password-file",
            [&book](std::string const & path) {
                std::string problem;
                if (!book.ReadFile(path, problem)) {
                    throw CLI::ValidationError("--password-file", problem);
                }
            },
            Text("File with a line FILE=PASSWORD for each protected PDF", "Help"))
        ->type_name(Text("FILE", "Help"));
}

void VerbList::AddFixedTime(CLI::App & verb, long long & time)
{
    verb.add_option("--fixed-time", time,
                    Text("Seconds since 1970 that stand for now in the output, for files that are the same to the byte",
                         "Help"))
        ->type_name(Text("SECONDS", "Help"))
        ->check(NumberBetween(0, std::numeric_limits<long long>::max()));
}

void VerbList::RefuseEmptyValues()
{
    for (CLI::App * const verb : m_Program.get_subcommands({})) {
        for (CLI::Option * const option : verb->get_options()) {
            // The values of settings have checks of their own: some may be empty.
            bool const isSwitch = 0 == option->get_items_expected_max();
            if (!isSwitch && ("set" != verb->get_name() || option->get_positional())) {
                option->check([](std::string const & text) {
                    return text.empty() ? Text("This needs a value that is not empty.", "Wrong use") : std::string();
                });
            }
        }
    }
}

int VerbList::RunParsed(VerbContext & context) const
{
    for (auto const & [verb, run] : m_Runners) {
        if (verb->parsed()) {
            return run(context);
        }
    }
    return ExitWrongUse;
}

}
