#include "app/BookSession.h"

#include "app/Interruption.h"
#include "app/NameChaptersCommand.h"
#include "app/StatusNames.h"
#include "commands/AddChapterCommand.h"
#include "commands/CloseBookCommand.h"
#include "commands/DeleteChaptersCommand.h"
#include "commands/LoadBookCommand.h"
#include "commands/MoveChaptersCommand.h"
#include "commands/NewBookCommand.h"
#include "commands/SaveBookAsCommand.h"
#include "commands/SaveBookCommand.h"
#include "commands/SetKeyChapterCommand.h"
#include "content/UpdateNumbersCommand.h"
#include "core/BookCollection.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/document/VantraController.h"
#include "import/Text.h"

#include <algorithm>
#include <chrono>
#include <set>
#include <thread>

namespace App
{

using Import::Text;

namespace
{

using ChapterPtr = Kernel::Counted<Book::BookChapter const>;

/// Marks a longest run of positions that rise: chapters that can stay where they are while the others move round them.
std::vector<bool> FindStayers(std::vector<int> const & positions)
{
    std::vector<int> length(positions.size(), 1);
    std::vector<int> previous(positions.size(), -1);
    int best = -1;
    for (std::size_t at = 0; at < positions.size(); ++at) {
        for (std::size_t before = 0; before < at; ++before) {
            if (positions[before] < positions[at] && length[at] < length[before] + 1) {
                length[at] = length[before] + 1;
                previous[at] = static_cast<int>(before);
            }
        }
        if (best < 0 || length[static_cast<std::size_t>(best)] < length[at]) {
            best = static_cast<int>(at);
        }
    }
    std::vector<bool> stays(positions.size());
    for (int at = best; 0 <= at; at = previous[static_cast<std::size_t>(at)]) {
        stays[static_cast<std::size_t>(at)] = true;
    }
    return stays;
}

}

BookSession::BookSession(Console & console, Listener & listener) : m_Console(console), m_Listener(listener)
{
    // The updates run when this program asks for them, not once for each chapter that comes or goes.
    Book::BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false);
}

BookSession::~BookSession()
{
    if (m_Book) {
        VantraController::GetInstance().EnqueueCommandAndWait(Kernel::MakeCounted<Book::CloseBookCommand>(m_Book));
        m_Book.Reset();
    }
    WaitForRest();
}

void BookSession::WaitForRest()
{
    while (Kernel::Activity::Rest::WaitingForUser == VantraController::GetInstance().WaitUntilIdle()) {
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
}

void BookSession::Run(Kernel::Counted<Book::BookCommand> const & command)
{
    struct Waiter : Kernel::Countable
    {
        std::mutex m_Lock;
        std::condition_variable m_Ended;
        bool m_HasEnded = false;
    };
    auto const waiter = Kernel::MakeCounted<Waiter>();
    command->SetCompletionCallback([waiter] {
        std::lock_guard const lock(waiter->m_Lock);
        waiter->m_HasEnded = true;
        waiter->m_Ended.notify_all();
    });
    Book::BookCollection::GetInstance().EnqueueCommand(command, m_Book);
    std::unique_lock lock(waiter->m_Lock);
    while (!waiter->m_Ended.wait_for(lock, std::chrono::milliseconds(50), [&] { return waiter->m_HasEnded; })) {
        if (bool * const abort = command->GetProgressAbortPointer(); abort && Interruption::IsRaised()) {
            std::atomic_ref(*abort).store(true, std::memory_order_relaxed);
        }
    }
}

bool BookSession::Open(std::string const & path, Import::MessageList & messages)
{
    auto const command = Kernel::MakeCounted<Book::LoadBookCommand>(String(path));
    VantraController::GetInstance().EnqueueCommand(Kernel::Counted<VantraCommand>(command));
    m_Book = command->GetBookController();
    if (!m_Book) {
        auto const result = command->GetResult();
        std::string reason = result ? result->GetReason().ToStd() : std::string();
        // The listener hears of it as well; one message is enough.
        WaitForRest();
        static_cast<void>(m_Listener.TakeMessages());
        messages.Error("book-unreadable", {path},
                       reason.empty() ? Text("The book cannot be opened.", "Program") : reason);
        return false;
    }
    WaitForRest();
    return true;
}

bool BookSession::OpenUsable(std::string const & path, Import::MessageList & messages)
{
    if (!Open(path, messages)) {
        return false;
    }
    RefreshChapters();
    ReportUnusable(messages);
    return true;
}

void BookSession::Create()
{
    auto const command = Kernel::MakeCounted<Book::NewBookCommand>();
    VantraController::GetInstance().EnqueueCommand(Kernel::Counted<VantraCommand>(command));
    m_Book = command->GetBookController();
}

BookSession::ChapterList BookSession::GetChapters() const
{
    ChapterList chapters;
    m_Book->GetChapters(chapters);
    return chapters;
}

void BookSession::RefreshChapters()
{
    Book::BookCollection::GetInstance().UpdateChapters(m_Book);
    WaitForRest();
}

void BookSession::ReportUnusable(Import::MessageList & messages) const
{
    for (ChapterPtr const & chapter : GetChapters()) {
        if (!chapter->IsValid()) {
            std::string const reason = Explain(*chapter);
            messages.Error("chapter-unusable", {chapter->GetPath().ToStd()},
                           Text("The chapter \"%1\" is missing from the output: %2", "Program", chapter->GetName(),
                                reason.empty() ? chapter->GetStatusDescription() + "." : String(reason)));
        }
    }
}

void BookSession::MatchChapters(std::vector<Import::ImportedChapter> const & wanted, bool hasTitlePage)
{
    std::vector<String> paths;
    std::map<String, String> names;
    for (Import::ImportedChapter const & chapter : wanted) {
        paths.emplace_back(chapter.m_Document.string());
        names.emplace(paths.back(), String(chapter.m_Title));
    }

    ChapterList gone;
    for (ChapterPtr const & chapter : GetChapters()) {
        if (!names.contains(chapter->GetPath())) {
            gone.push_back(chapter);
        }
    }
    if (!gone.empty()) {
        Run(Kernel::MakeCounted<Book::DeleteChaptersCommand>(gone));
    }

    // Runs of new chapters go in front of the next one that the book has.
    std::vector<String> missing;
    for (std::size_t at = 0; at <= paths.size(); ++at) {
        ChapterPtr const known = at < paths.size() ? ChapterPtr(m_Book->GetChapterFromPath(paths[at])) : nullptr;
        if (at < paths.size() && !known) {
            missing.push_back(paths[at]);
        } else if (!missing.empty()) {
            Run(Kernel::MakeCounted<Book::AddChapterCommand>(std::exchange(missing, {}), known));
            WaitForRest();
        }
    }

    std::vector<int> positions;
    ChapterList ordered;
    for (String const & path : paths) {
        if (ChapterPtr const chapter = m_Book->GetChapterFromPath(path)) {
            ordered.push_back(chapter);
            positions.push_back(m_Book->IndexFromChapter(chapter));
        }
    }
    std::vector<bool> const stays = FindStayers(positions);
    for (std::size_t at = ordered.size(); 0 < at--;) {
        if (!stays[at]) {
            ChapterPtr const before = at + 1 < ordered.size() ? ordered[at + 1] : nullptr;
            Run(Kernel::MakeCounted<Book::MoveChaptersCommand>(before, ChapterList{ordered[at]}));
        }
    }

    Run(Kernel::MakeCounted<NameChaptersCommand>(names));
    // Page 1 is the first page of the first chapter; a title page counts for itself.
    std::size_t const first = hasTitlePage ? 1 : 0;
    auto & collection = Book::BookCollection::GetInstance();
    for (std::size_t at = 0; at < ordered.size(); ++at) {
        // A document that was in another place before brings the number that it had there.
        bool const isFixed = at <= first;
        int const wantedStart = isFixed ? 1 : 0;
        if (wantedStart != ordered[at]->GetStartFromPage()) {
            collection.SetPageNumberOptions(m_Book, ordered[at], !isFixed, 1);
        }
    }
    // A book never draws over the preview that it has, and of these documents the first alone brings its own: another
    // key chapter that was made anew becomes key once more.
    ChapterPtr const key = m_Book->GetKeyChapter(false);
    if (key && std::any_of(wanted.begin(), wanted.end(), [&](Import::ImportedChapter const & chapter) {
            return chapter.m_IsFresh && &chapter != &wanted.front() &&
                   key->GetPath() == String(chapter.m_Document.string());
        })) {
        Run(Kernel::MakeCounted<Book::SetKeyChapterCommand>(key));
    }
    WaitForRest();
}

std::vector<BookSession::Extent> BookSession::GetExtents() const
{
    std::vector<Extent> extents;
    for (ChapterPtr const & chapter : GetChapters()) {
        extents.push_back({chapter->GetPath().ToStd(), chapter->GetPageCount(), chapter->GetCachedStartPage()});
    }
    return extents;
}

int BookSession::Update(Import::MessageList & messages)
{
    return Settle([this] { Book::BookCollection::GetInstance().PreOutput(m_Book, GetChapters()); }, messages);
}

int BookSession::Renumber(Import::MessageList & messages)
{
    return Settle(
        [this] {
            if (ChapterList chapters = GetChapters(); !chapters.empty()) {
                Run(Kernel::MakeCounted<Book::UpdateNumbersCommand>(std::move(chapters), true, true, true));
            }
        },
        messages);
}

int BookSession::Settle(std::function<void()> const & runPass, Import::MessageList & messages)
{
    std::vector<Extent> before = GetExtents();
    for (int pass = 1;; ++pass) {
        runPass();
        WaitForRest();
        std::vector<Extent> after = GetExtents();
        // Numbers follow from the counts of pages; as long as those stand still, one pass has said everything.
        auto const moved = std::mismatch(before.begin(), before.end(), after.begin(), after.end(),
                                         [](Extent const & a, Extent const & b) { return a.m_Pages == b.m_Pages; });
        if (moved.second == after.end() || Interruption::IsRaised()) {
            return pass;
        }
        if (g_MostPasses == pass) {
            std::string const name = std::filesystem::path(moved.second->m_Path).filename().string();
            messages.Warn("unsettled", {},
                          Text("The chapter %1 still changes its number of pages (%2, then %3) after %4 passes; page "
                               "numbers behind it may be off.",
                               "Program", name, moved.first->m_Pages, moved.second->m_Pages, int(g_MostPasses)));
            return pass;
        }
        before = std::move(after);
    }
}

bool BookSession::Save(std::string const & path, Import::MessageList & messages)
{
    return m_Book->CanSave() ? SaveAnyway(path, messages) : true;
}

bool BookSession::SaveAnyway(std::string const & path, Import::MessageList & messages)
{
    bool const isNew = m_Book->GetPath().Empty() || m_Book->GetPath() != String(path);
    m_Listener.Forget();
    if (isNew) {
        Run(Kernel::MakeCounted<Book::SaveBookAsCommand>(String(path), false));
    } else {
        Run(Kernel::MakeCounted<Book::SaveBookCommand>(false));
    }
    WaitForRest();
    Import::MessageList const heard = m_Listener.TakeMessages();
    messages.Append(heard);
    if (!m_Listener.WasSaved() && !heard.HasErrors()) {
        messages.Error("book-unsaved", {path}, Text("The book could not be saved.", "Program"));
    }
    return m_Listener.WasSaved();
}

}
