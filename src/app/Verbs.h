#pragma once

#include "app/Console.h"
#include "app/Listener.h"

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

class VerbList;

// Each adds its verb or verbs to the command line, in the order of the help.

/// Sets a folder of Markdown into a PDF.
void AddBuildVerb(VerbList & verbs);
/// Makes chapter documents of Markdown files or folders.
void AddImportVerb(VerbList & verbs);
/// Writes a book into a PDF.
void AddExportVerb(VerbList & verbs);
/// Lays a book's pages on sheets of paper.
void AddPrintVerb(VerbList & verbs);
/// Tells where each page of a book lands.
void AddPlanVerb(VerbList & verbs);
/// Makes a book.
void AddNewVerb(VerbList & verbs);
/// Shape a book's chapter list.
void AddAddVerb(VerbList & verbs);
void AddRemoveVerb(VerbList & verbs);
void AddMoveVerb(VerbList & verbs);
void AddReplaceVerb(VerbList & verbs);
/// Sets which chapter is the style source.
void AddKeyVerb(VerbList & verbs);
/// Sets the page that a chapter starts at.
void AddStartPageVerb(VerbList & verbs);
/// Shows and changes what a book keeps for all of its chapters.
void AddSetVerb(VerbList & verbs);
/// Write a book to another file, and a copy of it with its documents to a folder.
void AddSaveAsVerb(VerbList & verbs);
void AddPackageVerb(VerbList & verbs);
/// Tells the state of a book's chapters.
void AddStatusVerb(VerbList & verbs);
/// Checks a book's chapters before output.
void AddPreflightVerb(VerbList & verbs);
/// Finds chapters again whose files have moved.
void AddLocateVerb(VerbList & verbs);
/// Keeps a book open, and tells of each chapter that changes.
void AddWatchVerb(VerbList & verbs);
/// Tells what is in a book or document file.
void AddShowVerb(VerbList & verbs);

/// The whole program: reads the arguments (without the program's name), runs the verb, and gives the exit code. `ask`
/// is null where nobody can be asked.
int RunProgram(std::vector<std::string> const & arguments, std::ostream & out, std::ostream & err,
               TerminalFacts const & terminal, AskUser ask);

}
