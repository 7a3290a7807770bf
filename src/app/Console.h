#pragma once

#include "import/Message.h"

#include <iosfwd>
#include <map>
#include <mutex>
#include <string>

namespace App
{

/// How much the program says, and in what form.
struct ConsoleSettings
{
    bool m_IsQuiet = false;
    /// The result is one JSON document on the output; nothing else goes there.
    bool m_IsJson = false;
};

/// What the program's streams lead to.
struct TerminalFacts
{
    /// The error stream is a terminal: progress is a bar that redraws itself.
    bool m_HasProgress = false;
    /// Columns of that terminal.
    int m_ProgressColumns = 80;
    /// The output is a terminal that shows colours.
    bool m_HasColour = false;
    /// Columns of the output; 0 if it is no terminal, and lines may be as long as they like.
    int m_Columns = 0;
    /// Whether somebody still reads what goes to the output; null where that is always so.
    bool (*m_HasReader)() = nullptr;
};

/// What the program says to its user. Results go to the output, messages and progress to the error stream. Safe on any
/// thread.
class Console
{
public:
    /// While one exists, the progress bar is away and stays away: a question stands on the terminal in its place.
    class Pause
    {
    public:
        explicit Pause(Console & console);
        ~Pause();
        Pause(Pause const &) = delete;
        Pause & operator=(Pause const &) = delete;

    private:
        Console & m_Console;
    };

    Console(std::ostream & out, std::ostream & err, ConsoleSettings settings, TerminalFacts terminal);
    ~Console();

    [[nodiscard]] ConsoleSettings const & Settings() const { return m_Settings; }
    [[nodiscard]] TerminalFacts const & Terminal() const { return m_Terminal; }

    /// A line of the result; nothing when the result is JSON or quiet. What a terminal would obey is shown as "?": names
    /// of files and chapters may hold anything.
    void Say(std::string const & line);
    /// The same for a line of a table, which is harmless already and may hold colours.
    void SayStyled(std::string const & line);
    /// The result itself, whatever the settings.
    void SayResult(std::string const & text);
    /// An error or warning; warnings are left out when quiet.
    void Tell(Import::Message const & message);
    /// Messages of one kind about one file beyond the first few are counted instead, unless the result is JSON, where
    /// the whole list stands in it and none is printed.
    void Tell(Import::MessageList const & messages);
    void Error(std::string const & text);
    /// Progress of a step: `fraction` from 0 to 1.
    void Progress(std::string const & step, double fraction);
    /// Takes the progress bar away, before other output and at the end.
    void EndProgress();
    /// The output could not be written because its reader has closed it, as `head` does when it has seen enough.
    [[nodiscard]] bool HasReaderGone();

private:
    void EraseBar();

    std::mutex m_Lock;
    std::ostream & m_Out;
    std::ostream & m_Err;
    ConsoleSettings m_Settings;
    TerminalFacts m_Terminal;
    std::string m_Step;
    int m_Percent = -1;
    bool m_HasBar = false;
    int m_Pauses = 0;
};

}
