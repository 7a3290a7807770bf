#include "app/BookSession.h"
#include "app/FileCheck.h"
#include "app/Json.h"
#include "app/LocateChaptersCommand.h"
#include "app/VerbList.h"
#include "core/BookChapter.h"
#include "core/BookCollection.h"
#include "import/Text.h"

#include <filesystem>
#include <map>

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

struct LocateOptions
{
    std::string m_Book;
    std::string m_Old;
    std::string m_New;
};

/// A chapter's file, and where it is now.
struct Move
{
    fs::path m_Old;
    fs::path m_New;
};

/// The text's last part: a folder's own name also where a separator ends it.
fs::path NameOf(fs::path const & path)
{
    return path.has_filename() ? path.filename() : path.parent_path().filename();
}

/// What is left of `path` below `folder`; empty if it does not lie there.
fs::path Below(fs::path const & folder, fs::path const & path)
{
    fs::path const rest = path.lexically_relative(folder);
    return rest.empty() || *rest.begin() == ".." || *rest.begin() == "." ? fs::path() : rest;
}

/// One look for missing chapters: opens the book, moves what was found, saves, and tells.
class Search
{
public:
    Search(VerbContext & context, LocateOptions const & options) : m_Context(context), m_Options(options) {}

    int Run();

private:
    /// Which missing chapter the user means, and its file now; false with an error if there is none.
    bool FindMove(BookSession const & session, Move & move);
    /// By the user's words alone, on a terminal or not.
    void Locate(BookSession & session, Listener & listener);
    void Tell(bool isGood);

    VerbContext & m_Context;
    LocateOptions const & m_Options;
    Import::MessageList m_Messages;
    fs::path m_Book;
    Json m_Located = Json::array();
    Json m_Missing = Json::array();
    std::vector<std::string> m_Lines;
};

bool IsMissing(Book::BookChapter const & chapter)
{
    std::error_code error;
    return !fs::exists(chapter.GetPath().ToStd(), error);
}

bool Search::FindMove(BookSession const & session, Move & move)
{
    std::error_code error;
    fs::path const old = fs::absolute(m_Options.m_Old, error).lexically_normal();
    fs::path const target = fs::absolute(m_Options.m_New, error).lexically_normal();
    if (!fs::exists(target, error)) {
        m_Messages.Error("locate-target", {target.string()}, Text("There is no such file or folder.", "Program"));
        return false;
    }
    bool const isFolder = fs::is_directory(target, error);
    std::vector<Move> byName;
    for (auto const & chapter : session.GetChapters()) {
        fs::path const path = chapter->GetPath().ToStd();
        if (!IsMissing(*chapter)) {
            if (path == old) {
                m_Messages.Error("locate-present", {path.string()},
                                 Text("This chapter's file is where it was; \"korvane replace\" puts another one in its "
                                      "place.",
                                      "Program"));
                return false;
            }
            continue;
        }
        if (path == old) {
            move = {path, isFolder ? target / path.filename() : target};
            break;
        }
        // A folder that has moved: the first chapter that is found there explains the others.
        fs::path const rest = isFolder ? Below(old, path) : fs::path();
        if (!rest.empty() && move.m_Old.empty() && fs::exists(target / rest, error)) {
            move = {path, target / rest};
        }
        if (NameOf(m_Options.m_Old) == m_Options.m_Old && path.filename() == m_Options.m_Old) {
            byName.push_back({path, isFolder ? target / path.filename() : target});
        }
    }
    if (move.m_Old.empty() && 1 == byName.size()) {
        move = byName.front();
    }
    if (move.m_Old.empty()) {
        m_Messages.Error("locate-unknown", {m_Options.m_Old},
                         Text("No missing chapter of the book has this path; \"korvane status\" lists their paths.",
                              "Program"));
        return false;
    }
    if (!fs::is_regular_file(move.m_New, error)) {
        m_Messages.Error("locate-target", {move.m_New.string()}, Text("There is no such file.", "Program"));
        return false;
    }
    return true;
}

void Search::Locate(BookSession & session, Listener & listener)
{
    bool const isAsked = m_Options.m_Old.empty();
    std::map<Book::BookChapter const *, std::string> before;
    bool isAnyMissing = false;
    for (auto const & chapter : session.GetChapters()) {
        before[chapter.Get()] = chapter->GetPath().ToStd();
        isAnyMissing = isAnyMissing || IsMissing(*chapter);
    }
    if (!isAsked) {
        Move move;
        if (!FindMove(session, move)) {
            return;
        }
        session.Run(Kernel::MakeCounted<LocateChaptersCommand>(String(move.m_Old.string()), String(move.m_New.string())));
    } else if (isAnyMissing) {
        StandingAnswers answers = m_Context.m_Answers;
        answers.m_Locate = StandingAnswers::Choice::Yes;
        listener.SetAnswers(answers);
        session.Run(Kernel::MakeCounted<LocateChaptersCommand>());
    }
    session.RefreshChapters();
    for (auto const & chapter : session.GetChapters()) {
        std::string const path = chapter->GetPath().ToStd();
        if (before[chapter.Get()] != path) {
            m_Located.push_back(
                {{"name", chapter->GetName().ToStd()}, {"from", before[chapter.Get()]}, {"to", path}});
            m_Lines.push_back(Text("Found %1: %2", "Program", chapter->GetName(), path));
        } else if (IsMissing(*chapter)) {
            m_Missing.push_back(path);
            m_Messages.Warn("chapter-missing", {path}, Text("Still missing.", "Program"));
        }
    }
}

int Search::Run()
{
    m_Book = FullPath(m_Options.m_Book);
    BookFileLock lock;
    bool isGood = false;
    if (m_Options.m_Old.empty() != m_Options.m_New.empty()) {
        m_Messages.Error("locate-half", {m_Options.m_Old},
                         Text("Say both where the file was and where it is now.", "Program"));
    } else if (m_Options.m_Old.empty() && !m_Context.m_Ask) {
        m_Messages.Error("locate-asks", {m_Options.m_Book},
                         Text("Nobody can be asked here: name the old and the new path, as in \"korvane locate BOOK OLD "
                              "NEW\".",
                              "Program"));
    } else if (LockBook(m_Options.m_Book, lock, m_Messages)) {
        // Not asked on opening: the verb itself begins the search once it knows what was there before.
        StandingAnswers quiet = m_Context.m_Answers;
        quiet.m_Locate = StandingAnswers::Choice::No;
        Listener listener(m_Context.m_Console, m_Context.m_Ask, quiet);
        BookSession session(m_Context.m_Console, listener);
        isGood = session.Open(m_Book.string(), m_Messages);
        if (isGood) {
            Locate(session, listener);
        }
        if (isGood && !m_Located.empty()) {
            // A path that was found again is worth writing down, though a book does not count it as work.
            Book::BookCollection::GetInstance().GetMutableBookController(session.GetBook())->SetIsDirty(true);
            isGood = session.Save(m_Book.string(), m_Messages);
        }
        m_Messages.Append(listener.TakeMessages());
    }
    isGood = isGood && !m_Messages.HasErrors();
    Tell(isGood);
    return isGood ? ExitFine : ExitFailed;
}

void Search::Tell(bool isGood)
{
    Console & console = m_Context.m_Console;
    console.EndProgress();
    if (console.Settings().m_IsJson) {
        console.SayResult(Print({{"ok", isGood},
                                 {"book", m_Book.string()},
                                 {"located", m_Located},
                                 {"missing", m_Missing},
                                 {"messages", ToJson(m_Messages)}}));
    }
    console.Tell(m_Messages);
    for (std::string const & line : m_Lines) {
        console.Say(line);
    }
    if (isGood && m_Located.empty() && m_Missing.empty()) {
        console.Say(Text("No chapter is missing.", "Program"));
    }
}

}

void AddLocateVerb(VerbList & verbs)
{
    auto const options = std::make_shared<LocateOptions>();
    CLI::App & verb =
        verbs.Add("locate", Text("Find chapters again whose files have moved", "Help"),
                  "  korvane locate my.kvbook /old/place/storm.kvdoc /new/place/storm.kvdoc\n"
                  "  korvane locate my.kvbook /old/place /new/place\n"
                  "  korvane locate my.kvbook",
                  [options](VerbContext & context) { return Search(context, *options).Run(); });
    verb.add_option("BOOK", options->m_Book, Text("The book file", "Help"))->required();
    verb.add_option("OLD", options->m_Old,
                    Text("The missing chapter's file, or a folder that has moved; without it you are asked", "Help"));
    verb.add_option("NEW", options->m_New, Text("Where it is now", "Help"));
}

}
