#include "app/Interruption.h"
#include "app/ParserMessage.h"
#include "app/TextTable.h"
#include "app/VerbList.h"
#include "import/Text.h"

#include <ostream>
#include <termios.h>
#include <unistd.h>

namespace App
{

using Import::Text;

namespace
{

constexpr char const * g_Version = "korvane 0.1.0";

/// Keeps what is typed off the terminal for its own lifetime. Does nothing where there is none.
class EchoOff
{
public:
    EchoOff() : m_IsTerminal(0 == tcgetattr(STDIN_FILENO, &m_Before))
    {
        termios quiet = m_Before;
        quiet.c_lflag &= ~static_cast<tcflag_t>(ECHO);
        quiet.c_lflag |= ECHONL;
        if (m_IsTerminal) {
            tcsetattr(STDIN_FILENO, TCSAFLUSH, &quiet);
        }
    }
    ~EchoOff()
    {
        if (m_IsTerminal) {
            tcsetattr(STDIN_FILENO, TCSAFLUSH, &m_Before);
        }
    }
    EchoOff(EchoOff const &) = delete;
    EchoOff & operator=(EchoOff const &) = delete;

private:
    termios m_Before{};
    bool m_IsTerminal;
};

/// What the command line's library says of itself, in the user's language.
void TranslateHelp(CLI::App & program)
{
    auto const formatter = program.get_formatter();
    formatter->column_width(34);
    formatter->label("Usage", Text("Usage", "Help"));
    formatter->label("Positionals", Text("Arguments", "Help"));
    formatter->label("OPTIONS", Text("OPTIONS", "Help"));
    formatter->label("SUBCOMMAND", Text("VERB", "Help"));
    formatter->label("REQUIRED", Text("(needed)", "Help"));
    formatter->label("TEXT", Text("TEXT", "Help"));
    formatter->label("INT", Text("NUMBER", "Help"));
    program.option_defaults()->group(Text("Options", "Help"));
    program.set_help_flag("-h,--help", Text("Print this help and end", "Help"));
    program.set_version_flag("--version", g_Version, Text("Print the version and end", "Help"));
}

/// Runs the verb that the command line names; what went wrong unexpectedly becomes a message.
int RunVerb(VerbList const & verbs, Console & console, AskUser ask)
{
    if (ask) {
        ask = [&console, ask = std::move(ask)](std::string const & question, std::string & answer) {
            Console::Pause const pause(console);
            return ask(Harmless(question), answer);
        };
        verbs.Answers().m_Passwords->SetAsk([ask](std::string const & question, std::string & answer) {
            EchoOff const noEcho;
            return ask(question, answer);
        });
    }
    VerbContext context{console, std::move(ask), verbs.Answers()};
    try {
        return verbs.RunParsed(context);
    } catch (std::bad_alloc const &) {
        console.Error(Text("There is not enough memory for this.", "Program"));
    } catch (std::exception const & error) {
        console.Error(Text("Unexpected failure: %1", "Program", error.what()));
    }
    return ExitFailed;
}

}

int RunProgram(std::vector<std::string> const & arguments, std::ostream & out, std::ostream & err,
               TerminalFacts const & terminal, AskUser ask)
{
    CLI::App app(Text("Korvane sets folders of Markdown, and books of many documents, into print-ready PDF.", "Help"),
                 "korvane");
    TranslateHelp(app);
    app.require_subcommand(1);
    app.footer(Text("Example:", "Help") + "\n  korvane build my-book -o my-book.pdf\n\n" +
               Text("Every verb has --help. Exit codes: 0 fine, 1 the work failed, 2 wrong use.", "Help"));

    VerbList verbs(app);
    AddBuildVerb(verbs);
    AddImportVerb(verbs);
    AddExportVerb(verbs);
    AddPrintVerb(verbs);
    AddPlanVerb(verbs);
    AddNewVerb(verbs);
    AddAddVerb(verbs);
    AddRemoveVerb(verbs);
    AddMoveVerb(verbs);
    AddReplaceVerb(verbs);
    AddKeyVerb(verbs);
    AddStartPageVerb(verbs);
    AddSetVerb(verbs);
    AddSaveAsVerb(verbs);
    AddPackageVerb(verbs);
    AddStatusVerb(verbs);
    AddPreflightVerb(verbs);
    AddLocateVerb(verbs);
    AddWatchVerb(verbs);
    AddShowVerb(verbs);
    verbs.RefuseEmptyValues();

    Interruption const interruption;
    bool isRead = false;
    int code = ExitFine;
    try {
        app.parse(std::vector<std::string>(arguments.rbegin(), arguments.rend()));
        isRead = true;
    } catch (CLI::Success const & wish) {
        // Help or the version.
        app.exit(wish, out, err);
    } catch (CLI::ParseError const & error) {
        err << Harmless(DescribeWrongUse(app, error)) << '\n'
            << Text("Run with --help for more information.", "Help") << '\n';
        code = ExitWrongUse;
    }
    Console console(out, err, verbs.Settings(), terminal);
    if (isRead) {
        code = RunVerb(verbs, console, std::move(ask));
    }
    out.flush();
    // A reader that has seen enough is no failure.
    if (!out && !console.HasReaderGone()) {
        console.Error(Text("The output could not be written.", "Program"));
        code = ExitFailed;
    }
    return code;
}

}
