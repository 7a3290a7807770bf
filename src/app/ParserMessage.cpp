#include "app/ParserMessage.h"

#include "import/Text.h"

#include <CLI/CLI.hpp>
#include <array>
#include <regex>

namespace App
{

using Import::Text;

namespace
{

using Match = std::smatch;

/// One kind of sentence that the library makes, and ours for it.
struct Sentence
{
    char const * m_Pattern;
    std::string (*m_Say)(Match const & match);
};

/// Tried in this order.
constexpr std::array g_Sentences{
    Sentence{"Exactly 1 option from .(.*),(.*). is required( and .*)?",
             [](Match const & match) {
                 return match[3].matched
                            ? Text("%1 and %2 do not go together.", "Wrong use", match[1].str(), match[2].str())
                            : Text("Either %1 or %2 is needed.", "Wrong use", match[1].str(), match[2].str());
             }},
    Sentence{"(.*) excludes (.*)",
             [](Match const & match) {
                 return Text("%1 and %2 do not go together.", "Wrong use", match[1].str(), match[2].str());
             }},
    Sentence{"(.*) is required", [](Match const & match) { return Text("%1 is needed.", "Wrong use", match[1].str()); }},
    Sentence{"(.*): [0-9]+ required (.*) missing",
             [](Match const & match) {
                 return Text("%1: a value (%2) is needed behind it.", "Wrong use", match[1].str(), match[2].str());
             }},
    Sentence{"(.*): At Most 1 required but received [0-9]+",
             [](Match const & match) { return Text("%1 may be given only once.", "Wrong use", match[1].str()); }},
    Sentence{"Could not convert: ([^ ]*) = (.*)",
             [](Match const & match) {
                 return Text("%1: \"%2\" cannot stand here.", "Wrong use", match[1].str(),
                             match[2].str());
             }},
    Sentence{"The value (.*) is not an allowed value for (.*)",
             [](Match const & match) {
                 return Text("%1 is a switch, so it takes no value such as \"%2\".", "Wrong use", match[2].str(),
                             match[1].str());
             }},
};

std::string Join(std::vector<std::string> const & words)
{
    std::string text;
    for (std::string const & word : words) {
        text += (text.empty() ? "" : " ") + word;
    }
    return text;
}

}

std::string DescribeWrongUse(CLI::App const & program, CLI::ParseError const & error)
{
    std::vector<std::string> const unread = program.remaining(true);
    if (program.get_subcommands().empty()) {
        return unread.empty() ? Text("Say what to do, such as \"korvane build FOLDER\".", "Wrong use")
                              : Text("There is no verb \"%1\".", "Wrong use", unread.front());
    }
    if (dynamic_cast<CLI::ExtrasError const *>(&error)) {
        return Text("This does not belong here: %1", "Wrong use", Join(unread));
    }
    std::string const sentence = error.what();
    for (Sentence const & row : g_Sentences) {
        if (Match match; std::regex_match(sentence, match, std::regex(row.m_Pattern))) {
            return row.m_Say(match);
        }
    }
    return sentence;
}

}
