#include "app/BookSession.h"
#include "app/Json.h"
#include "app/VerbList.h"
#include "core/BookChapter.h"
#include "import/Text.h"

#include <algorithm>

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

/// The names of the statuses in JSON: stable words, not the user's language.
char const * NameOf(Book::BookChapter::Status status)
{
    switch (status) {
    case Book::BookChapter::Status::Ok:
        return "ok";
    case Book::BookChapter::Status::OpenForEdit:
        return "open-for-edit";
    case Book::BookChapter::Status::Locked:
        return "locked";
    case Book::BookChapter::Status::NotFound:
        return "not-found";
    case Book::BookChapter::Status::OutOfDate:
        return "out-of-date";
    case Book::BookChapter::Status::Restricted:
        break;
    }
    return "restricted";
}

std::string Padded(std::string text, std::size_t width)
{
    std::size_t length = 0;
    for (char const c : text) {
        length += 0x80 != (static_cast<unsigned char>(c) & 0xC0) ? 1 : 0;
    }
    text.append(length < width ? width - length : 0, ' ');
    return text;
}

int RunStatus(VerbContext & context, std::string const & file)
{
    Import::MessageList messages;
    Console & console = context.m_Console;
    std::error_code error;
    fs::path const path = fs::absolute(file, error).lexically_normal();
    Json chapters = Json::array();
    std::vector<std::string> lines;
    bool isGood = false;
    int pages = 0;
    {
        Listener listener(console, context.m_Ask, context.m_Answers);
        BookSession session(console, listener);
        isGood = session.Open(path.string(), messages);
        if (isGood) {
            session.RefreshChapters();
            int index = 0;
            for (auto const & chapter : session.GetChapters()) {
                pages += chapter->GetPageCount();
                chapters.push_back({{"index", index},
                                    {"name", chapter->GetName().ToStd()},
                                    {"path", chapter->GetPath().ToStd()},
                                    {"key", chapter->IsKey()},
                                    {"status", NameOf(chapter->GetStatus())},
                                    {"pages", chapter->DescribePages().ToStd()},
                                    {"pageCount", chapter->GetPageCount()},
                                    {"startFromPage", chapter->GetStartFromPage()},
                                    {"cachedStartPage", chapter->GetCachedStartPage()},
                                    {"preflight", chapter->GetPreflightDescription().ToStd()}});
                lines.push_back(
                    Padded(std::to_string(index + 1), 4) + Padded(chapter->GetName().ToStd(), 40) + "  " +
                    Padded(chapter->DescribePages().ToStd(), 14) + Padded(chapter->GetStatusDescription().ToStd(), 12) +
                    chapter->GetPreflightDescription().ToStd() + (chapter->IsKey() ? " (style source)" : ""));
                ++index;
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
    for (std::string const & line : lines) {
        console.Say(line.substr(0, line.find_last_not_of(' ') + 1));
    }
    return isGood ? ExitFine : ExitFailed;
}

}

void AddStatusVerb(VerbList & verbs)
{
    auto const book = std::make_shared<std::string>();
    CLI::App & verb = verbs.Add("status", Text("Tell the state of a book's chapters", "Help"),
                                "  korvane status my-book/.korvane/book.kvbook",
                                [book](VerbContext & context) { return RunStatus(context, *book); });
    verb.add_option("BOOK", *book, Text("The book file", "Help"))->required();
    verbs.AddAnswers(verb);
}

}
