#include "app/BookSession.h"
#include "app/FileCheck.h"
#include "app/Interruption.h"
#include "app/Json.h"
#include "app/StatusNames.h"
#include "app/VerbList.h"
#include "commands/PreflightChaptersCommand.h"
#include "core/BookChapter.h"
#include "import/Text.h"

#include <filesystem>

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

/// What the checks of all chapters found, in both forms.
struct Findings
{
    void Add(Book::BookChapter const & chapter, int index);

    Json m_Chapters = Json::array();
    std::vector<std::string> m_Lines;
    int m_Errors = 0;
    int m_Warnings = 0;
    int m_Unchecked = 0;

private:
    [[nodiscard]] Json AddFinding(PreflightResult const & finding);
};

Json Findings::AddFinding(PreflightResult const & finding)
{
    bool const isError = PreflightResult::Status::Error == finding.m_Status;
    ++(isError ? m_Errors : m_Warnings);
    std::string const place = finding.m_Folio.Empty() ? std::string() : Text("page %1: ", "Program", finding.m_Folio);
    m_Lines.push_back("  " + (isError ? Text("error: ", "Program") : Text("warning: ", "Program")) + place +
                      finding.m_Message.ToString().ToStd());
    Json entry = {{"severity", PreflightResult::NameOf(finding.m_Status)},
                  {"problem", PreflightResult::NameOf(finding.m_Problem)},
                  {"subject", finding.m_Subject.ToStd()}};
    if (0 <= finding.m_PageIndex) {
        entry["pageIndex"] = finding.m_PageIndex;
        entry["page"] = finding.m_Folio.ToStd();
    }
    entry["text"] = finding.m_Message.ToString().ToStd();
    return entry;
}

void Findings::Add(Book::BookChapter const & chapter, int index)
{
    auto const results = chapter.GetPreflightResults();
    std::string const title = std::to_string(index + 1) + ". " + chapter.GetName().ToStd() + " (" +
                              chapter.GetPath().ToStd() + ")";
    Json findings = Json::array();
    if (!results) {
        ++m_Unchecked;
        m_Lines.push_back(title);
        std::string const reason = Explain(chapter);
        m_Lines.push_back("  " + Text("not checked: %1", "Program", Describe(chapter).m_Text) +
                          (reason.empty() ? std::string() : ". " + reason));
    } else if (!results->GetResults().empty()) {
        m_Lines.push_back(title);
        for (PreflightResult const & finding : results->GetResults()) {
            findings.push_back(AddFinding(finding));
        }
    }
    m_Chapters.push_back({{"index", index},
                          {"name", chapter.GetName().ToStd()},
                          {"path", chapter.GetPath().ToStd()},
                          {"status", NameOf(chapter.GetStatus())},
                          {"checked", static_cast<bool>(results)},
                          {"findings", std::move(findings)}});
}

int RunPreflight(VerbContext & context, std::string const & file)
{
    Import::MessageList messages;
    Console & console = context.m_Console;
    fs::path const path = FullPath(file);
    Findings findings;
    if (FindBook(file, messages)) {
        Listener listener(console, context.m_Ask, context.m_Answers);
        BookSession session(console, listener);
        if (session.Open(path.string(), messages)) {
            session.RefreshChapters();
            BookSession::ChapterList const chapters = session.GetChapters();
            session.Run(Kernel::MakeCounted<Book::PreflightChaptersCommand>(chapters, true));
            for (std::size_t index = 0; index < chapters.size(); ++index) {
                findings.Add(*chapters[index], static_cast<int>(index));
            }
        }
        messages.Append(listener.TakeMessages());
    }
    if (Interruption::IsRaised()) {
        messages.Error("interrupted", {}, Text("Interrupted.", "Program"));
    }
    bool const isGood =
        0 == findings.m_Errors + findings.m_Warnings + findings.m_Unchecked && !messages.HasErrors();
    console.EndProgress();
    if (console.Settings().m_IsJson) {
        console.SayResult(Print({{"ok", isGood},
                                 {"book", path.string()},
                                 {"errors", findings.m_Errors},
                                 {"warnings", findings.m_Warnings},
                                 {"chapters", findings.m_Chapters},
                                 {"messages", ToJson(messages)}}));
    }
    console.Tell(messages);
    for (std::string const & line : findings.m_Lines) {
        console.Say(line);
    }
    if (isGood) {
        console.Say(Text("No problems found.", "Program"));
    } else if (0 < findings.m_Errors + findings.m_Warnings) {
        console.Say(Text("Errors: %1, warnings: %2", "Program", findings.m_Errors, findings.m_Warnings));
    }
    return isGood ? ExitFine : ExitFailed;
}

}

void AddPreflightVerb(VerbList & verbs)
{
    auto const book = std::make_shared<std::string>();
    CLI::App & verb = verbs.Add("preflight", Text("Check a book's chapters before output", "Help"),
                                "  korvane preflight my.kvbook --json",
                                [book](VerbContext & context) { return RunPreflight(context, *book); });
    verb.add_option("BOOK", *book, Text("The book file", "Help"))->required();
    verbs.AddAnswers(verb);
}

}
