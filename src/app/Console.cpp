#include "app/Console.h"

#include "app/TextTable.h"
#include "import/Text.h"

#include <algorithm>
#include <ostream>
#include <tuple>

namespace App
{

namespace
{

constexpr int g_MessagesOfOneKind = 5;
constexpr int g_BarWidth = 30;
constexpr int g_LeastBarWidth = 5;

/// A bar that leaves the last column free: a line that goes on below could not be taken away again.
std::string DrawBar(std::string const & step, int percent, int columns)
{
    std::string const number = std::to_string(percent) + "%";
    // Two brackets and two spaces; and what the number may grow to.
    int const room = columns - 1 - DisplayWidth(step) - 4 - 4;
    if (room < g_LeastBarWidth) {
        return CutToWidth(step, std::max(columns - 6, 1)) + " " + number;
    }
    int const width = std::min(room, g_BarWidth);
    auto const filled = static_cast<std::size_t>(percent * width / 100);
    return step + " [" + std::string(filled, '#') + std::string(static_cast<std::size_t>(width) - filled, ' ') + "] " +
           number;
}

}

Console::Console(std::ostream & out, std::ostream & err, ConsoleSettings settings, TerminalFacts terminal)
    : m_Out(out),
      m_Err(err),
      m_Settings(settings),
      m_Terminal(terminal)
{
}

Console::~Console()
{
    EndProgress();
}

Console::Pause::Pause(Console & console) : m_Console(console)
{
    std::lock_guard const lock(m_Console.m_Lock);
    m_Console.EraseBar();
    ++m_Console.m_Pauses;
}

Console::Pause::~Pause()
{
    std::lock_guard const lock(m_Console.m_Lock);
    --m_Console.m_Pauses;
}

void Console::EraseBar()
{
    if (m_HasBar) {
        m_Err << "\r\x1b[K" << std::flush;
        m_HasBar = false;
    }
}

void Console::Say(std::string const & line)
{
    SayStyled(Harmless(line));
}

void Console::SayStyled(std::string const & line)
{
    std::lock_guard const lock(m_Lock);
    if (!m_Settings.m_IsQuiet && !m_Settings.m_IsJson) {
        EraseBar();
        m_Out << line << '\n' << std::flush;
    }
}

void Console::SayResult(std::string const & text)
{
    std::lock_guard const lock(m_Lock);
    EraseBar();
    m_Out << text;
    if (!text.ends_with('\n')) {
        m_Out << '\n';
    }
    m_Out << std::flush;
}

void Console::Tell(Import::Message const & message)
{
    std::lock_guard const lock(m_Lock);
    bool const isError = Import::Severity::Error == message.m_Severity;
    if (isError || !m_Settings.m_IsQuiet) {
        EraseBar();
        m_Err << Harmless(Import::ToText(message)) << '\n' << std::flush;
    }
}

void Console::Tell(Import::MessageList const & messages)
{
    if (m_Settings.m_IsJson) {
        return;
    }
    using Key = std::tuple<std::string, std::string>;
    std::map<Key, int> counts;
    std::vector<Key> order;
    for (Import::Message const & message : messages.All()) {
        Key const key{message.m_Place.m_File, message.m_Kind};
        int const count = ++counts[key];
        if (count <= g_MessagesOfOneKind || Import::Severity::Error == message.m_Severity) {
            Tell(message);
        } else if (g_MessagesOfOneKind + 1 == count) {
            order.push_back(key);
        }
    }
    for (Key const & key : order) {
        int const more = counts[key] - g_MessagesOfOneKind;
        Tell({Import::Severity::Note,
              std::get<1>(key),
              {std::get<0>(key)},
              Import::CountText("%1 more of this kind (%2); --json lists them all.",
                                "%1 more of this kind (%2); --json lists them all.", "Program", more,
                                std::get<1>(key))});
    }
}

void Console::Error(std::string const & text)
{
    Tell({Import::Severity::Error, "", {"korvane"}, text});
}

void Console::Progress(std::string const & step, double fraction)
{
    std::lock_guard const lock(m_Lock);
    if (m_Settings.m_IsQuiet || m_Settings.m_IsJson || 0 < m_Pauses) {
        return;
    }
    int const percent = static_cast<int>(std::clamp(fraction, 0.0, 1.0) * 100);
    if (!m_Terminal.m_HasProgress) {
        // Lines for logs: each step once.
        if (step != m_Step) {
            m_Step = step;
            m_Err << Harmless(step) << "...\n" << std::flush;
        }
        return;
    }
    if (step == m_Step && percent == m_Percent && m_HasBar) {
        return;
    }
    m_Step = step;
    m_Percent = percent;
    m_HasBar = true;
    m_Err << "\r\x1b[K" << DrawBar(Harmless(step), percent, m_Terminal.m_ProgressColumns) << std::flush;
}

bool Console::HasReaderGone()
{
    std::lock_guard const lock(m_Lock);
    return m_Terminal.m_HasReader && !m_Terminal.m_HasReader();
}

void Console::EndProgress()
{
    std::lock_guard const lock(m_Lock);
    EraseBar();
    m_Step.clear();
    m_Percent = -1;
}

}
