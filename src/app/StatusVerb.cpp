#include "app/BookSession.h"
#include "app/FileCheck.h"
#include "app/Json.h"
#include "app/StatusNames.h"
#include "app/TextTable.h"
#include "app/VerbList.h"
#include "core/BookChapter.h"
#include "import/Text.h"

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

CellLook LookOf(PreflightResult::Status status)
{
    return PreflightResult::Status::Error == status     ? CellLook::Bad
           : PreflightResult::Status::Warning == status ? CellLook::Warning
                                                        : CellLook::Dim;
}

Json DescribeChapter(Book::BookChapter const & chapter, int index)
{
    return {{"index", index},
            {"name", chapter.GetName().ToStd()},
            {"path", chapter.GetPath().ToStd()},
            {"key", chapter.IsKey()},
            {"status", NameOf(chapter.GetStatus())},
            {"pages", chapter.DescribePages().ToStd()},
            {"pageCount", chapter.GetPageCount()},
            {"startFromPage", chapter.GetStartFromPage()},
            {"cachedStartPage", chapter.GetCachedStartPage()},
            {"preflight", chapter.GetPreflightDescription().ToStd()}};
}

std::vector<TableCell> MakeRow(Book::BookChapter const & chapter, int index)
{
    int const pages = chapter.GetPageCount();
    return {{chapter.IsKey() ? "\u2605" : "", CellLook::Strong},
            {std::to_string(index + 1), CellLook::Dim},
            {chapter.GetName().ToStd(), CellLook::Plain},
            {chapter.DescribePages().ToStd(), CellLook::Plain},
            {0 < pages ? std::to_string(pages) : "", CellLook::Dim},
            Describe(chapter),
            {chapter.GetPreflightDescription().ToStd(), LookOf(chapter.GetPreflightStatus())},
            {fs::path(chapter.GetPath().ToStd()).filename().string(), CellLook::Dim}};
}

struct StatusOptions
{
    std::string m_Book;
    std::string m_Colour = "auto";
};

int RunStatus(VerbContext & context, StatusOptions const & options)
{
    Import::MessageList messages;
    Console & console = context.m_Console;
    fs::path const path = FullPath(options.m_Book);
    Json chapters = Json::array();
    TextTable table({{""},
                     {Text("No", "Table"), false, true},
                     {Text("Chapter", "Table"), true},
                     {Text("Pages", "Table")},
                     {Text("Count", "Table"), false, true},
                     {Text("State", "Table")},
                     {Text("Preflight", "Table"), true},
                     {Text("Document", "Table"), true}});
    bool isGood = false;
    int pages = 0;
    int count = 0;
    if (FindBook(options.m_Book, messages)) {
        Listener listener(console, context.m_Ask, context.m_Answers);
        {
            BookSession session(console, listener);
            isGood = session.Open(path.string(), messages);
            if (isGood) {
                session.RefreshChapters();
                for (auto const & chapter : session.GetChapters()) {
                    pages += chapter->GetPageCount();
                    chapters.push_back(DescribeChapter(*chapter, count));
                    table.AddRow(MakeRow(*chapter, count++));
                    if (std::string const reason = Explain(*chapter); !reason.empty()) {
                        messages.Warn("chapter-unusable", {chapter->GetPath().ToStd()}, reason);
                    }
                }
            }
        }
        messages.Append(listener.TakeMessages());
    }
    isGood = isGood && !messages.HasErrors();
    console.EndProgress();
    if (console.Settings().m_IsJson) {
        console.SayResult(Print({{"ok", isGood},
                                 {"book", path.string()},
                                 {"name", path.stem().string()},
                                 {"pageCount", pages},
                                 {"chapters", chapters},
                                 {"messages", ToJson(messages)}}));
    }
    console.Tell(messages);
    bool const hasColour =
        "always" == options.m_Colour || ("auto" == options.m_Colour && console.Terminal().m_HasColour);
    for (std::string const & line : table.Layout(console.Terminal().m_Columns, hasColour)) {
        console.SayStyled(line);
    }
    if (isGood) {
        console.Say(Import::CountText("%1 chapter", "%1 chapters", "Program", count) + ", " +
                    Import::CountText("%1 page", "%1 pages", "Program", pages));
    }
    return isGood ? ExitFine : ExitFailed;
}

}

void AddStatusVerb(VerbList & verbs)
{
    auto const options = std::make_shared<StatusOptions>();
    CLI::App & verb = verbs.Add("status", Text("Tell the state of a book's chapters", "Help"),
                                "  korvane status my-book/.korvane/book.kvbook",
                                [options](VerbContext & context) { return RunStatus(context, *options); });
    verb.add_option("BOOK", options->m_Book, Text("The book file", "Help"))->required();
    verb.add_option("--colour,--color", options->m_Colour,
                    Text("When to use colours; by default on a terminal", "Help"))
        ->type_name("auto|always|never")
        ->check(OneOfWords({"auto", "always", "never"}));
    verbs.AddAnswers(verb);
}

}
