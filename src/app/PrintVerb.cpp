#include "app/BookExport.h"
#include "app/BookSettings.h"
#include "app/FileCheck.h"
#include "app/Interruption.h"
#include "app/Json.h"
#include "app/PrintLayout.h"
#include "app/VerbList.h"
#include "framework/document/VantraController.h"
#include "import/Text.h"
#include "output/PrintBookCommand.h"
#include "output/PrintProofCommand.h"

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

struct PrintOptions
{
    std::string m_Book;
    std::string m_Output;
    std::string m_Preview;
    PrintLayout m_Layout;
    bool m_SkipsUpdates = false;
    long long m_FixedTime = -1;
};

/// What has been made, for the result.
struct PrintOutcome
{
    std::size_t m_Sheets = 0;
    std::size_t m_Pages = 0;
};

Kernel::Counted<Renderer::FileExportOptionsPDF const> MakePdfOptions(BookSession const & session,
                                                                     PrintOptions const & options)
{
    BookSettings settings = BookSettings::Of(*session.GetBook());
    settings.m_Pdf.m_Hyperlinks = false;
    settings.m_Pdf.m_Bookmarks = false;
    // A sheet has no page number of its own.
    settings.m_Pdf.m_PageLabels = false;
    if (options.m_FixedTime >= 0) {
        settings.m_Pdf.m_FixedTime = options.m_FixedTime;
    }
    auto const pdf = Kernel::MakeCounted<Renderer::FileExportOptionsPDF>();
    pdf->SetSettings(settings.m_Pdf);
    return pdf;
}

/// Runs one of the print commands and takes over what it has to say.
bool RunCommand(BookSession & session, Kernel::Counted<Book::PrintCommand> const & command, fs::path const & target,
                Import::MessageList & messages)
{
    session.Run(command);
    VantraController::GetInstance().WaitUntilIdle();
    for (auto const & chapter : command->GetMissingChapters()) {
        messages.Error("chapter-unreadable", {chapter->GetPath().ToStd()},
                       Text("This chapter could not be opened, so its pages are blank.", "Program"));
    }
    TellWarnings(command->GetWarnings(), messages);
    if (IsSuccess(command->GetResult())) {
        return true;
    }
    if (!Interruption::IsRaised()) {
        std::string const reason = command->GetError().ToStd();
        messages.Error("print-failed", {target.string()},
                       reason.empty() ? Text("The file could not be made.", "Program") : WithRemedy(reason));
    }
    return false;
}

bool PrintSheets(BookSession & session, PrintOptions const & options, PrintOutcome & outcome,
                 Import::MessageList & messages)
{
    std::vector<Book::PaginatorPage> const sheets = LaySheets(session, options.m_Layout, messages);
    if (sheets.empty()) {
        return false;
    }
    std::set<int> pages;
    for (Book::PaginatorPage const & sheet : sheets) {
        for (Book::PaginatorTarget const & target : sheet.m_Targets) {
            pages.insert(target.m_Index);
        }
    }
    outcome = {sheets.size(), pages.size()};
    Book::PrintSettings const settings = options.m_Layout.GetSettings();
    bool isGood = true;
    if (!options.m_Output.empty()) {
        fs::path const target = FullPath(options.m_Output);
        isGood = RunCommand(session,
                            Kernel::MakeCounted<Book::PrintBookCommand>(sheets, settings, String(target.string()),
                                                                        MakePdfOptions(session, options)),
                            target, messages);
    }
    if (isGood && !options.m_Preview.empty() && !Interruption::IsRaised()) {
        fs::path const target = FullPath(options.m_Preview);
        if (sheets.size() > Book::PrintProofCommand::MostSheets) {
            messages.Warn("preview", {target.string()},
                          Text("The picture shows the first %1 of %2 sides.", "Program",
                               Book::PrintProofCommand::MostSheets, sheets.size()));
        }
        isGood = RunCommand(
            session, Kernel::MakeCounted<Book::PrintProofCommand>(sheets, settings, String(target.string())), target,
            messages);
    }
    return isGood;
}

/// Opens the book and brings it up to date, as an export does.
bool PrepareBook(BookSession & session, PrintOptions const & options, fs::path const & book,
                 Import::MessageList & messages)
{
    if (!session.OpenUsable(book.string(), messages)) {
        return false;
    }
    if (options.m_SkipsUpdates) {
        return true;
    }
    session.Update(messages);
    return session.Save(book.string(), messages);
}

int RunPrint(VerbContext & context, PrintOptions const & options)
{
    Import::MessageList messages;
    fs::path const book = FullPath(options.m_Book);
    BookFileLock lock;
    PrintOutcome outcome;
    bool isGood = false;
    if ((options.m_Output.empty() || CheckOutput(FullPath(options.m_Output), OutputKind::Pdf, messages)) &&
        (options.m_Preview.empty() || CheckOutput(FullPath(options.m_Preview), OutputKind::Png, messages)) &&
        ClaimBook(options.m_Book, options.m_SkipsUpdates, lock, messages)) {
        Listener listener(context.m_Console, context.m_Ask, context.m_Answers);
        BookSession session(context.m_Console, listener);
        isGood = PrepareBook(session, options, book, messages) && !Interruption::IsRaised() &&
                 PrintSheets(session, options, outcome, messages);
        messages.Append(listener.TakeMessages());
    }
    if (Interruption::IsRaised() && !messages.HasErrors()) {
        messages.Error("interrupted", {}, Text("Interrupted; nothing was written.", "Program"));
    }
    isGood = isGood && !messages.HasErrors();

    Console & console = context.m_Console;
    console.EndProgress();
    if (console.Settings().m_IsJson) {
        Json result{{"ok", isGood}, {"book", book.string()}, {"sheets", outcome.m_Sheets}, {"pages", outcome.m_Pages}};
        result["output"] = options.m_Output.empty() ? Json() : Json(FullPath(options.m_Output).string());
        result["preview"] = options.m_Preview.empty() ? Json() : Json(FullPath(options.m_Preview).string());
        result["messages"] = ToJson(messages);
        console.SayResult(Print(result));
    }
    console.Tell(messages);
    for (std::string const & target : {options.m_Output, options.m_Preview}) {
        if (isGood && !target.empty()) {
            console.Say(Import::CountText("Wrote %2: %1 page", "Wrote %2: %1 pages", "Program", outcome.m_Pages,
                                          FullPath(target).string()) +
                        " " + Import::CountText("on %1 side", "on %1 sides", "Program", outcome.m_Sheets));
        }
    }
    return isGood ? ExitFine : ExitFailed;
}

}

void AddPrintVerb(VerbList & verbs)
{
    auto const options = std::make_shared<PrintOptions>();
    CLI::App & verb =
        verbs.Add("print", Text("Lay a book's pages on sheets of paper, as a PDF to print", "Help"),
                  "  korvane print my-book.kvbook -o booklet.pdf --layout booklet --paper A4\n"
                  "  korvane print my-book.kvbook --preview proof.png --layout nup --rows 2 --columns 3 --paper A3 --marks",
                  [options](VerbContext & context) { return RunPrint(context, *options); });
    verb.add_option("BOOK", options->m_Book, Text("The book file", "Help"))->required();
    auto * const output = verb.add_option("-o,--output", options->m_Output, Text("The PDF", "Help"))->type_name("OUT.pdf");
    auto * const preview =
        verb.add_option("--preview", options->m_Preview, Text("A picture of the sheets, as a proof", "Help"))
            ->type_name("OUT.png");
    AddLayoutOptions(verb, options->m_Layout);
    verb.parse_complete_callback([output, preview] {
        if (output->count() == 0 && preview->count() == 0) {
            throw CLI::RequiredError(Text("-o OUT.pdf or --preview OUT.png", "Help"));
        }
    });
    verb.add_flag("--no-update", options->m_SkipsUpdates, Text("Leave numbers and references as they are", "Help"));
    verbs.AddFixedTime(verb, options->m_FixedTime);
    verbs.AddAnswers(verb);
}

}
