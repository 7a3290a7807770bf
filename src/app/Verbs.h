#pragma once

#include "app/Console.h"
#include "app/Listener.h"

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace App
{

/// Exit codes of the program.
enum ExitCode : int
{
    ExitFine = 0,
    ExitFailed = 1,
    ExitWrongUse = 2
};

/// What every verb gets: the ways to speak with the user.
struct VerbContext
{
    Console & m_Console;
    AskUser m_Ask;
    StandingAnswers m_Answers;
};

struct BuildOptions
{
    std::filesystem::path m_Folder;
    /// Empty: what the manifest says, or FOLDER/NAME.pdf.
    std::string m_Output;
    std::string m_Template;
    std::string m_Work;
    bool m_IsForced = false;
    long long m_FixedTime = -1;
};

struct ImportOptions
{
    std::vector<std::string> m_Sources;
    std::string m_Output;
    std::string m_Template;
};

struct ExportOptions
{
    std::string m_Book;
    std::string m_Output;
    bool m_HasMarks = false;
    bool m_IncludesBleed = false;
    bool m_SkipsUpdates = false;
    long long m_FixedTime = -1;
};

/// Sets a folder of Markdown into a PDF.
int RunBuild(VerbContext & context, BuildOptions const & options);
/// Makes chapter documents of Markdown files or folders.
int RunImport(VerbContext & context, ImportOptions const & options);
/// Writes a book into a PDF.
int RunExport(VerbContext & context, ExportOptions const & options);
/// Tells the state of a book's chapters.
int RunStatus(VerbContext & context, std::string const & book);
/// Tells what is in a book or document file.
int RunShow(VerbContext & context, std::string const & file);

/// The whole program: reads the arguments (without the program's name), runs the verb, and gives the exit code. `ask`
/// is null where nobody can be asked.
int RunProgram(std::vector<std::string> const & arguments, std::ostream & out, std::ostream & err, bool isTerminal,
               AskUser ask);

}
