#include "app/BookWatch.h"
#include "app/FileCheck.h"
#include "app/Interruption.h"
#include "app/Json.h"
#include "app/VerbList.h"
#include "import/Text.h"

#include <chrono>
#include <thread>

namespace App
{

using Import::Text;

namespace
{

/// Between two looks at the files: a change shows well within a second.
constexpr std::chrono::milliseconds g_Interval(250);

struct WatchOptions
{
    std::string m_Book;
    bool m_Renumbers = false;
};

int RunWatch(VerbContext & context, WatchOptions const & options)
{
    Import::MessageList messages;
    Console & console = context.m_Console;
    BookFileLock lock;
    if (auto const book = LockBook(options.m_Book, lock, messages)) {
        Listener listener(console, context.m_Ask, context.m_Answers);
        BookSession session(console, listener);
        if (session.Open(book->string(), messages)) {
            BookWatch watch(console, session, listener, options.m_Renumbers);
            watch.Begin();
            while (!Interruption::IsRaised() && !console.HasReaderGone()) {
                watch.Look();
                std::this_thread::sleep_for(g_Interval);
            }
        }
        messages.Append(listener.TakeMessages());
    }
    console.EndProgress();
    if (console.Settings().m_IsJson && !messages.Empty()) {
        console.SayResult(ToLine({{"messages", ToJson(messages)}}));
    }
    console.Tell(messages);
    return messages.HasErrors() ? ExitFailed : ExitFine;
}

}

void AddWatchVerb(VerbList & verbs)
{
    auto const options = std::make_shared<WatchOptions>();
    CLI::App & verb =
        verbs.Add("watch", Text("Keep a book open, and tell of each chapter that changes", "Help"),
                  "  korvane watch my.kvbook --renumber",
                  [options](VerbContext & context) { return RunWatch(context, *options); });
    verb.add_option("BOOK", options->m_Book, Text("The book file", "Help"))->required();
    verb.add_flag("--renumber", options->m_Renumbers,
                  Text("Let page numbers run on anew when a chapter has become longer or shorter", "Help"));
    verbs.AddAnswers(verb);
}

}
