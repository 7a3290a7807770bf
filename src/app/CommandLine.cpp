#include "app/Interruption.h"
#include "app/Verbs.h"

#include <CLI/CLI.hpp>
#include <ostream>

namespace App
{

namespace
{

constexpr char const * g_Version = "korvane 0.1.0";

/// Options that every verb has.
struct CommonOptions
{
    bool m_IsJson = false;
    bool m_IsQuiet = false;
};

void AddCommon(CLI::App & verb, CommonOptions & common)
{
    verb.add_flag("--json", common.m_IsJson, "Give the result as one JSON document");
    verb.add_flag("--quiet,-q", common.m_IsQuiet, "Say nothing but errors");
}

void AddAnswers(CLI::App & verb, StandingAnswers & answers)
{
    auto const set = [](StandingAnswers::Choice & choice, StandingAnswers::Choice value) {
        return [&choice, value](std::int64_t) { choice = value; };
    };
    using Choice = StandingAnswers::Choice;
    verb.add_flag_function("--upgrade", set(answers.m_Upgrade, Choice::Yes),
                           "Bring documents of an older version up to date");
    verb.add_flag_function("--no-upgrade", set(answers.m_Upgrade, Choice::No),
                           "Leave out documents of an older version");
    verb.add_flag_function("--locate", set(answers.m_Locate, Choice::Yes), "Look for chapters whose files are gone");
    verb.add_flag_function("--no-locate", set(answers.m_Locate, Choice::No),
                           "Go on without chapters whose files are gone");
}

void AddFixedTime(CLI::App & verb, long long & time)
{
    verb.add_option("--fixed-time", time,
                    "Seconds since 1970 that stand for now in the PDF, for files that are the same to the byte")
        ->type_name("SECONDS")
        ->check(CLI::NonNegativeNumber);
}

}

int RunProgram(std::vector<std::string> const & arguments, std::ostream & out, std::ostream & err, bool isTerminal,
               AskUser ask)
{
    CLI::App app("Korvane sets folders of Markdown, and books of many documents, into print-ready PDF.", "korvane");
    app.set_version_flag("--version", g_Version);
    app.require_subcommand(1);
    app.get_formatter()->column_width(34);
    app.footer("Example:\n  korvane build my-book -o my-book.pdf\n\nEvery verb has --help. Exit codes: 0 fine, 1 the "
               "work failed, 2 wrong use.");

    CommonOptions common;
    StandingAnswers answers;

    BuildOptions build;
    CLI::App & buildVerb = *app.add_subcommand("build", "Set a folder of Markdown chapters into a PDF");
    buildVerb.add_option("FOLDER", build.m_Folder, "Folder with book.toml, SUMMARY.md or Markdown files")->required();
    buildVerb
        .add_option("-o,--output", build.m_Output, "The PDF; by default FOLDER/NAME.pdf, or what the manifest says")
        ->type_name("OUT.pdf");
    buildVerb.add_option("--template", build.m_Template, "Template by name (novel, manual, report) or a .toml file")
        ->type_name("NAME|FILE");
    buildVerb.add_option("--work", build.m_Work, "Folder for the documents in between; by default FOLDER/.korvane")
        ->type_name("DIR");
    buildVerb.add_flag("--force", build.m_IsForced, "Make the PDF anew even if nothing has changed");
    AddFixedTime(buildVerb, build.m_FixedTime);
    AddCommon(buildVerb, common);
    AddAnswers(buildVerb, answers);
    buildVerb.footer("Example:\n  korvane build docs/handbook -o handbook.pdf --template manual\n\n"
                     "A second run takes only what has changed. Work in progress can be stopped with Ctrl-C.");

    ImportOptions import;
    CLI::App & importVerb = *app.add_subcommand("import", "Make chapter documents (.kvdoc) of Markdown");
    importVerb.add_option("SOURCE", import.m_Sources, "Markdown files, or one folder")->required();
    importVerb
        .add_option("-o,--output", import.m_Output,
                    "Folder for the documents; by default .korvane beside the first source")
        ->type_name("DIR");
    importVerb.add_option("--template", import.m_Template, "Template by name or a .toml file")->type_name("NAME|FILE");
    AddCommon(importVerb, common);
    importVerb.footer("Example:\n  korvane import chapter1.md chapter2.md -o documents");

    ExportOptions exportOptions;
    CLI::App & exportVerb = *app.add_subcommand("export", "Write a book (.kvbook) into a PDF");
    exportVerb.add_option("BOOK", exportOptions.m_Book, "The book file")->required();
    exportVerb.add_option("-o,--output", exportOptions.m_Output, "The PDF")->required()->type_name("OUT.pdf");
    exportVerb.add_flag("--marks", exportOptions.m_HasMarks, "Crop marks round each page, with the bleed");
    exportVerb.add_flag("--bleed", exportOptions.m_IncludesBleed, "Include the bleed");
    exportVerb.add_flag("--no-update", exportOptions.m_SkipsUpdates, "Leave numbers and references as they are");
    AddFixedTime(exportVerb, exportOptions.m_FixedTime);
    AddCommon(exportVerb, common);
    AddAnswers(exportVerb, answers);
    exportVerb.footer("Example:\n  korvane export my-book/.korvane/book.kvbook -o print.pdf --marks");

    std::string statusBook;
    CLI::App & statusVerb = *app.add_subcommand("status", "Tell the state of a book's chapters");
    statusVerb.add_option("BOOK", statusBook, "The book file")->required();
    AddCommon(statusVerb, common);
    AddAnswers(statusVerb, answers);
    statusVerb.footer("Example:\n  korvane status my-book/.korvane/book.kvbook --json");

    std::string showFile;
    CLI::App & showVerb = *app.add_subcommand("show", "Tell what is in a book or document file");
    showVerb.add_option("FILE", showFile, "A .kvbook or .kvdoc file")->required();
    AddCommon(showVerb, common);
    showVerb.footer("Example:\n  korvane show my-book/.korvane/chapter1.kvdoc --json");

    try {
        std::vector<std::string> reversed(arguments.rbegin(), arguments.rend());
        app.parse(std::move(reversed));
    } catch (CLI::ParseError const & error) {
        bool const isHelp = 0 == error.get_exit_code();
        app.exit(error, out, err);
        return isHelp ? ExitFine : ExitWrongUse;
    }

    Interruption const interruption;
    Console console(out, err, {common.m_IsQuiet, common.m_IsJson, isTerminal});
    VerbContext context{console, std::move(ask), answers};
    int code = ExitFine;
    try {
        if (buildVerb.parsed()) {
            code = RunBuild(context, build);
        } else if (importVerb.parsed()) {
            code = RunImport(context, import);
        } else if (exportVerb.parsed()) {
            code = RunExport(context, exportOptions);
        } else if (statusVerb.parsed()) {
            code = RunStatus(context, statusBook);
        } else {
            code = RunShow(context, showFile);
        }
    } catch (std::bad_alloc const &) {
        console.Error("There is not enough memory for this.");
        code = ExitFailed;
    } catch (std::exception const & error) {
        console.Error(std::string("Unexpected failure: ") + error.what());
        code = ExitFailed;
    }
    out.flush();
    if (!out) {
        console.Error("The output could not be written.");
        code = ExitFailed;
    }
    return code;
}

}
