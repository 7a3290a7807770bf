#include "app/BookWatch.h"

#include "app/Json.h"
#include "app/StatusNames.h"
#include "core/BookCollection.h"
#include "import/Text.h"

#include <algorithm>
#include <chrono>
#include <ctime>

namespace App
{

using Import::Text;

namespace
{

/// The time of day on the user's clock.
std::string TimeOfDay()
{
    std::time_t const now = std::chrono::system_clock::to_time_t(std::chrono::system_clock::now());
    std::tm parts{};
    localtime_r(&now, &parts);
    char text[16];
    return {text, std::strftime(text, sizeof text, "%H:%M:%S", &parts)};
}

}

BookWatch::BookWatch(Console & console, BookSession & session, Listener & listener, bool renumbers)
    : m_Console(console),
      m_Session(session),
      m_Listener(listener),
      m_Renumbers(renumbers)
{
    Book::BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(renumbers);
}

std::vector<FileSight> BookWatch::LookAtFiles() const
{
    std::vector<FileSight> files;
    for (auto const & chapter : m_Session.GetChapters()) {
        files.push_back(FileSight::Of(chapter->GetPath().ToStd()));
    }
    return files;
}

std::vector<BookWatch::State> BookWatch::ReadStates() const
{
    std::vector<State> states;
    for (auto const & chapter : m_Session.GetChapters()) {
        states.push_back({chapter->GetStatus(), chapter->DescribePages().ToStd(), chapter->GetPageCount()});
    }
    return states;
}

void BookWatch::Begin()
{
    m_Files = LookAtFiles();
    Refresh();
    std::vector<State> const now = ReadStates();
    m_Console.EndProgress();
    Tell({}, now);
    m_States = now;
}

bool BookWatch::Look()
{
    std::vector<FileSight> files = LookAtFiles();
    if (files == m_Files) {
        return false;
    }
    // What was seen is from before the pass: a file that changes while it runs is seen the next time.
    m_Files = std::move(files);
    Refresh();
    std::vector<State> const now = ReadStates();
    m_Console.EndProgress();
    Tell(m_States, now);
    m_States = now;
    return true;
}

void BookWatch::Refresh()
{
    m_Session.RefreshChapters();
    if (!m_Renumbers) {
        return;
    }
    std::vector<State> const now = ReadStates();
    auto const isAny = [&now](Book::BookChapter::Status status) {
        return std::any_of(now.begin(), now.end(), [status](State const & state) { return state.m_Status == status; });
    };
    bool const isChanged = isAny(Book::BookChapter::Status::OutOfDate) || (!m_States.empty() && now != m_States);
    // A chapter that another program has open will be back: the others are not numbered as if it were gone.
    if (!isChanged || isAny(Book::BookChapter::Status::Locked)) {
        return;
    }
    Book::BookCollection::GetInstance().UpdatePageNumbers(m_Session.GetBook(), m_Session.GetChapters().front());
    m_Session.WaitForRest();
    Import::MessageList messages;
    m_Session.Save(m_Session.GetBook()->GetPath().ToStd(), messages);
    TellMessages(messages);
}

void BookWatch::Tell(std::vector<State> const & before, std::vector<State> const & now)
{
    Import::MessageList messages;
    for (std::size_t index = 0; index < now.size(); ++index) {
        State const * const old = index < before.size() ? &before[index] : nullptr;
        if (!old || *old != now[index]) {
            TellChapter(index, old, now[index]);
            auto const chapter = m_Session.GetChapters()[index];
            if (std::string const reason = Explain(*chapter); !reason.empty()) {
                messages.Warn("chapter-unusable", {chapter->GetPath().ToStd()}, reason);
            }
        }
    }
    messages.Append(m_Listener.TakeMessages());
    TellMessages(messages);
}

void BookWatch::TellChapter(std::size_t index, State const * before, State const & now)
{
    auto const chapter = m_Session.GetChapters()[index];
    if (m_Console.Settings().m_IsJson) {
        m_Console.SayResult(ToLine({{"time", TimeOfDay()},
                                    {"index", index},
                                    {"name", chapter->GetName().ToStd()},
                                    {"path", chapter->GetPath().ToStd()},
                                    {"status", NameOf(now.m_Status)},
                                    {"pages", now.m_Pages},
                                    {"pageCount", now.m_PageCount}}));
        return;
    }
    std::string line = TimeOfDay() + "  " + std::to_string(index + 1) + ". " + chapter->GetName().ToStd() + "  " +
                       Describe(*chapter).m_Text;
    if (!now.m_Pages.empty()) {
        line += "  " + (before && !before->m_Pages.empty() && before->m_Pages != now.m_Pages
                            ? Text("pages %1 (before: %2)", "Program", now.m_Pages, before->m_Pages)
                            : Text("pages %1", "Program", now.m_Pages));
    }
    m_Console.Say(line);
}

void BookWatch::TellMessages(Import::MessageList const & messages)
{
    if (!m_Console.Settings().m_IsJson) {
        m_Console.Tell(messages);
    } else if (!messages.Empty()) {
        m_Console.SayResult(ToLine({{"time", TimeOfDay()}, {"messages", ToJson(messages)}}));
    }
}

}
