// What a book's chapters cost while it looks at them: one chapter's load, status and release; a pass over a long book;
// a pass over what the user has open.

#include "BenchChapter.h"

#include "commands/AddChapterCommand.h"
#include "commands/CloseBookCommand.h"
#include "commands/LoadBookCommand.h"
#include "commands/NewBookCommand.h"
#include "commands/UpdateChaptersCommand.h"
#include "core/BookCollection.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Trace.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>

using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

namespace fs = std::filesystem;

double PeakMegabytes()
{
    std::ifstream status("/proc/self/status");
    std::string line;
    while (std::getline(status, line)) {
        if (line.starts_with("VmHWM:")) {
            return std::stod(line.substr(6)) / 1024;
        }
    }
    return 0;
}

/// A book of so many chapters of one kind, in a folder that goes with it.
class LongBook
{
public:
    explicit LongBook(int chapters)
    {
        std::string pattern = (fs::temp_directory_path() / "korvane-bench-XXXXXX").string();
        m_Folder = mkdtemp(pattern.data());
        Book::BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false);
        auto const command = MakeCounted<Book::NewBookCommand>();
        VantraController::GetInstance().EnqueueCommand(Counted<VantraCommand>(command));
        m_Book = command->GetBookController();
        String const first((m_Folder / "0.kvdoc").string());
        WriteBenchChapter(first, BenchLinks::None);
        std::vector<String> paths{first};
        for (int chapter = 1; chapter < chapters; ++chapter) {
            paths.emplace_back((m_Folder / (std::to_string(chapter) + ".kvdoc")).string());
            fs::copy_file(first.ToStd(), paths.back().ToStd());
        }
        Book::BookCollection::GetInstance().EnqueueCommandAndWait(
            MakeCounted<Book::AddChapterCommand>(paths, nullptr), m_Book);
        Rest();
    }
    ~LongBook()
    {
        VantraController::GetInstance().EnqueueCommandAndWait(MakeCounted<Book::CloseBookCommand>(m_Book));
        m_Book->WaitUntilCommandQueueEmpty();
        Book::BookCollection::GetInstance().RemoveBookController(m_Book);
        Rest();
        std::error_code ignored;
        fs::remove_all(m_Folder, ignored);
    }
    LongBook(LongBook const &) = delete;
    LongBook & operator=(LongBook const &) = delete;

    static void Rest() { VantraController::GetInstance().WaitUntilIdle(); }

    fs::path m_Folder;
    Counted<Book::BookController> m_Book;
};

void BM_LoadStatusRelease(benchmark::State & state)
{
    LongBook const book(1);
    Counted<Book::BookChapter> const chapter = book.m_Book->GetChapterAtIndex(0);
    for (auto _ : state) {
        // Each round also waits for the close of the one before.
        book.m_Book->UpdateChapterStatus(chapter, nullptr, false, false);
    }
    state.counters["pages"] = chapter->GetPageCount();
    LongBook::Rest();
}
BENCHMARK(BM_LoadStatusRelease)->Unit(benchmark::kMillisecond);

void BM_FullPass(benchmark::State & state)
{
    LongBook const book(static_cast<int>(state.range(0)));
    double const before = PeakMegabytes();
    std::size_t mostOpen = 0;
    Kernel::SetTraceTarget([&](String const & line) {
        if (line.View().starts_with("LoadChapter:")) {
            mostOpen = std::max(mostOpen, VantraController::GetInstance().GetDocumentControllers().size());
        }
    });
    for (auto _ : state) {
        book.m_Book->UpdateChapters();
        LongBook::Rest();
    }
    Kernel::SetTraceTarget({});
    state.counters["open at a load"] = static_cast<double>(mostOpen);
    state.counters["peak MB"] = PeakMegabytes();
    state.counters["grown MB"] = PeakMegabytes() - before;
}
BENCHMARK(BM_FullPass)->Arg(100)->Arg(1000)->Unit(benchmark::kMillisecond)->UseRealTime();

void BM_ForegroundPass(benchmark::State & state)
{
    LongBook const book(10);
    std::vector<Counted<DocumentController>> open;
    for (int chapter = 0; chapter < 10; ++chapter) {
        String const path = book.m_Book->GetChapterAtIndex(chapter)->GetPath();
        OpenDocumentFailedNotification failure(path, true);
        open.push_back(VantraController::GetInstance().OpenDocument(path, failure));
    }
    LongBook::Rest();
    for (auto _ : state) {
        Book::BookCollection::GetInstance().EnqueueCommandAndWait(
            Counted<Book::BookCommand>(MakeCounted<Book::UpdateChaptersCommand>(true)), book.m_Book);
    }
    for (Counted<DocumentController> const & document : open) {
        VantraController::GetInstance().EnqueueCommandAndWait(
            MakeCounted<CloseDocumentCommand>(document, nullptr, false, true));
    }
    LongBook::Rest();
}
BENCHMARK(BM_ForegroundPass)->Unit(benchmark::kMillisecond)->UseRealTime();

/// Book files of three chapters each, opened one after the other until all is at rest, and closed again. With all of
/// them open a chapter of one is opened in front and closed, which every book hears of.
void BM_ManyBooks(benchmark::State & state)
{
    constexpr int Chapters = 3;
    auto const count = static_cast<std::size_t>(state.range(0));
    std::string pattern = (fs::temp_directory_path() / "korvane-bench-XXXXXX").string();
    fs::path const folder = mkdtemp(pattern.data());
    VantraController & application = VantraController::GetInstance();
    Book::BookCollection & collection = Book::BookCollection::GetInstance();
    collection.SetUpdatePageNumbersAutomatically(false);
    // One package, copied as often as wanted: it names its chapters by their place beside it.
    fs::path const model = folder / "model";
    fs::create_directory(model);
    auto const book = MakeCounted<Book::BookController>();
    Book::BookController::ChapterPaths packaged;
    for (int chapter = 0; chapter < Chapters; ++chapter) {
        String const path((model / (std::to_string(chapter) + ".kvdoc")).string());
        WriteBenchChapter(path, BenchLinks::None);
        packaged.emplace(book->AddChapter(path, -1), path);
    }
    DocumentSaveResult saved;
    book->SaveBookAsPackage(saved, String((model / "book.kvbook").string()), packaged);
    LongBook::Rest();
    std::vector<String> paths;
    for (std::size_t index = 0; index < count; ++index) {
        fs::copy(model, folder / std::to_string(index));
        paths.emplace_back((folder / std::to_string(index) / "book.kvbook").string());
    }
    String const lastChapter((folder / std::to_string(count - 1) / "0.kvdoc").string());
    using Clock = std::chrono::steady_clock;
    std::chrono::duration<double, std::milli> opening{};
    std::chrono::duration<double, std::milli> visiting{};
    std::chrono::duration<double, std::milli> closing{};
    for (auto _ : state) {
        std::vector<Counted<Book::BookController>> books;
        Clock::time_point const begin = Clock::now();
        for (String const & path : paths) {
            auto const command = MakeCounted<Book::LoadBookCommand>(path);
            application.EnqueueCommand(Counted<VantraCommand>(command));
            books.push_back(command->GetBookController());
        }
        LongBook::Rest();
        Clock::time_point const opened = Clock::now();
        OpenDocumentFailedNotification failure(lastChapter, true);
        auto const document = application.OpenDocument(lastChapter, failure);
        LongBook::Rest();
        application.EnqueueCommandAndWait(MakeCounted<CloseDocumentCommand>(document, nullptr, false, true));
        LongBook::Rest();
        Clock::time_point const visited = Clock::now();
        for (Counted<Book::BookController> const & open : books) {
            application.EnqueueCommandAndWait(MakeCounted<Book::CloseBookCommand>(open));
            open->WaitUntilCommandQueueEmpty();
            collection.RemoveBookController(open);
        }
        LongBook::Rest();
        opening += opened - begin;
        visiting += visited - opened;
        closing += Clock::now() - visited;
    }
    auto const each = [&](auto total) { return total.count() / static_cast<double>(state.iterations() * count); };
    state.counters["open ms each"] = each(opening);
    state.counters["visit ms"] = visiting.count() / static_cast<double>(state.iterations());
    state.counters["close ms each"] = each(closing);
    std::error_code ignored;
    fs::remove_all(folder, ignored);
}
BENCHMARK(BM_ManyBooks)->ArgName("books")->Arg(100)->Arg(1000)->Unit(benchmark::kMillisecond)->UseRealTime();

}

BENCHMARK_MAIN();
