// What the book costs before any chapter is opened: dispatch of notifications, the road of commands, records in memory.

#include "commands/BookCommand.h"
#include "core/BookCollection.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/document/DocumentSettings.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/CommandNotifications.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Semaphore.h"
#include "framework/story/StoryBuilder.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <malloc.h>
#include <thread>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

/// Does what the measurement gives it to do.
class WorkCommand final : public BookCommand
{
public:
    explicit WorkCommand(std::function<void()> work) : m_Work(std::move(work)) {}
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override { return {"Work", "Bench"}; }
    void Do() override { m_Work(); }

private:
    std::function<void()> const m_Work;
};

/// Open books while it lives, each with so many chapters whose files are not there.
class OpenBooks
{
public:
    OpenBooks(int books, int chapters)
    {
        for (int index = 0; index < books; ++index) {
            auto const book = MakeCounted<BookController>();
            for (int chapter = 0; chapter < chapters; ++chapter) {
                book->AddChapter("/publications/handbook/volume-" + std::to_string(index) + "/chapter-" +
                                     std::to_string(chapter) + ".kvdoc",
                                 -1);
            }
            BookCollection::GetInstance().AddBookController(book);
            m_Books.push_back(book);
        }
    }
    ~OpenBooks()
    {
        BookCollection::GetInstance().SetUIActiveBookController(nullptr);
        for (auto const & book : m_Books) {
            book->WaitUntilCommandQueueEmpty();
            BookCollection::GetInstance().RemoveBookController(book);
        }
        VantraController::GetInstance().WaitUntilIdle();
    }

    std::vector<Counted<BookController>> m_Books;
};

void BM_NotifyUnrelated(benchmark::State & state)
{
    OpenBooks const open(10, 1000);
    BookCollection & collection = BookCollection::GetInstance();
    Counted<Kernel::Notification> const first =
        MakeCounted<CommandProgressNotification>(open.m_Books[0], String("Work"), 0.5f, false);
    Counted<Kernel::Notification> const second =
        MakeCounted<CommandFailedNotification>(open.m_Books[0], String("Work"), String());
    bool const isMixed = state.range(0) != 0;
    for (auto _ : state) {
        collection.Notify(first);
        if (isMixed) {
            collection.Notify(second);
        }
    }
    state.SetItemsProcessed(state.iterations() * (isMixed ? 2 : 1));
}
BENCHMARK(BM_NotifyUnrelated)->ArgName("classesTakeTurns")->Arg(0)->Arg(1);

/// The document is the last chapter of the book in front; the book's update in progress ends the matter there.
void BM_NotifyToBookInFront(benchmark::State & state)
{
    String const path = Kernel::FileSystem::GetTemporaryFolder() + "/korvane-bench-last-chapter.kvdoc";
    Story::StoryBuilder builder;
    Counted<DocumentController> const document = DocumentController::CreateDocument({}, builder.Finish());
    DocumentSaveResult saved;
    document->SaveDocument(saved, path);
    OpenBooks const open(10, 999);
    open.m_Books[3]->AddChapter(path, -1);
    BookCollection & collection = BookCollection::GetInstance();
    collection.SetUIActiveBookController(open.m_Books[3]);
    open.m_Books[3]->SetInIndexUpdate(true);
    if (!(collection.GetBookFromDocument(document) == open.m_Books[3])) {
        state.SkipWithError("the document is not found in its book");
    }
    Counted<Kernel::Notification> const notification =
        MakeCounted<IndexTopicsChangedNotification>(Counted<DocumentController const>(document));
    for (auto _ : state) {
        collection.Notify(notification);
    }
    Kernel::FileSystem::Delete(path, 0);
}
BENCHMARK(BM_NotifyToBookInFront)->Unit(benchmark::kMicrosecond);

/// From handing a command in to its first instruction, the queue at rest each time.
void BM_EnqueueToDo(benchmark::State & state)
{
    using Clock = std::chrono::steady_clock;
    OpenBooks const open(1, 0);
    std::vector<double> microseconds;
    for (auto _ : state) {
        Clock::time_point begun;
        Kernel::Semaphore done(0);
        auto const command = MakeCounted<WorkCommand>([&begun] { begun = Clock::now(); });
        command->SetCompletionCallback([&done] { done.Signal(); });
        Clock::time_point const handedIn = Clock::now();
        BookCollection::GetInstance().EnqueueCommand(command, open.m_Books[0]);
        done.Wait(0);
        std::chrono::duration<double> const time = begun - handedIn;
        state.SetIterationTime(time.count());
        microseconds.push_back(time.count() * 1e6);
        // Until the pool's threads are asleep again.
        std::this_thread::sleep_for(std::chrono::microseconds(200));
    }
    auto const middle = microseconds.begin() + static_cast<std::ptrdiff_t>(microseconds.size() / 2);
    std::nth_element(microseconds.begin(), middle, microseconds.end());
    state.counters["median_us"] = *middle;
}
BENCHMARK(BM_EnqueueToDo)->UseManualTime()->Unit(benchmark::kMicrosecond)->Iterations(5000);

/// The same for a caller that waits: it works the idle queue itself.
void BM_EnqueueAndWait(benchmark::State & state)
{
    OpenBooks const open(1, 0);
    for (auto _ : state) {
        BookCollection::GetInstance().EnqueueCommandAndWait(MakeCounted<WorkCommand>([] {}), open.m_Books[0]);
    }
}
BENCHMARK(BM_EnqueueAndWait)->Unit(benchmark::kMicrosecond);

/// Commands of one producer, in turn for each of the books, until all have run.
void BM_Commands(benchmark::State & state)
{
    constexpr int Count = 100000;
    auto const books = static_cast<std::size_t>(state.range(0));
    OpenBooks const open(static_cast<int>(books), 0);
    for (auto _ : state) {
        std::atomic<int> done{0};
        for (std::size_t index = 0; index < Count; ++index) {
            BookCollection::GetInstance().EnqueueCommand(MakeCounted<WorkCommand>([&done] { ++done; }),
                                                         open.m_Books[index % books]);
        }
        for (auto const & book : open.m_Books) {
            book->WaitUntilCommandQueueEmpty();
        }
        if (done != Count) {
            state.SkipWithError("a command was lost");
        }
    }
    state.SetItemsProcessed(state.iterations() * Count);
}
BENCHMARK(BM_Commands)->ArgName("books")->Arg(1)->Arg(100)->Unit(benchmark::kMillisecond)->UseRealTime();

/// What the heap holds for a chapter of 100 facing spreads.
void BM_RecordMemory(benchmark::State & state)
{
    std::vector<SpreadInfo> spreads(100);
    for (SpreadInfo & spread : spreads) {
        spread.m_PageRects = {{0, 0, 420, 595}, {420, 0, 840, 595}};
        spread.m_PageBoxes = spread.m_PageRects;
        spread.m_NonExporting = {false, false};
    }
    constexpr std::size_t Count = 1000;
    std::size_t bytes = 0;
    for (auto _ : state) {
        std::vector<Counted<BookChapter>> chapters;
        chapters.reserve(Count);
        std::size_t const before = mallinfo2().uordblks;
        for (std::size_t index = 0; index < Count; ++index) {
            auto const chapter = MakeCounted<BookChapter>(String("/publications/handbook/chapter.kvdoc"));
            chapter->SetSpreadInfo(spreads);
            chapters.push_back(chapter);
        }
        bytes = mallinfo2().uordblks - before;
    }
    state.counters["KB_per_record"] = static_cast<double>(bytes) / Count / 1024;
}
BENCHMARK(BM_RecordMemory)->Unit(benchmark::kMillisecond);

}

BENCHMARK_MAIN();
