#include "core/BookController.h"
#include "framework/document/DocumentSaveResult.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/kernel/FileSystem.h"

#include <benchmark/benchmark.h>

#include <unistd.h>

using Book::BookController;
using Kernel::Counted;
using Kernel::FileSystem;
using Kernel::MakeCounted;

namespace
{

/// A file of this process alone, which is removed at the end.
struct File
{
    String const m_Path{"/tmp/korvane-bench-" + std::to_string(::getpid()) + ".kvbook"};
    ~File() { FileSystem::Delete(m_Path, 0); }
};

/// Puts the book file of a publication with so many chapters together without opening one.
void WriteBook(String const & path, int chapters)
{
    auto const book = MakeCounted<BookController>();
    for (int i = 0; i < chapters; ++i) {
        book->AddChapter(String("/home/somebody/books/the long one/chapter-" + std::to_string(i) + ".kvdoc"), -1);
    }
    DocumentSaveResult saved;
    book->SaveBookAsCopy(saved, path);
}

Counted<BookController> Load(String const & path)
{
    auto const book = MakeCounted<BookController>();
    OpenDocumentFailedNotification failure(path, false);
    book->LoadBook(path, failure);
    book->DisableCommandEnqueueAndEmpty();
    return book;
}

void LoadBook(benchmark::State & state)
{
    File const file;
    WriteBook(file.m_Path, static_cast<int>(state.range(0)));
    std::uint64_t size = 0;
    FileSystem::GetSize(file.m_Path, size);
    for (auto _ : state) {
        benchmark::DoNotOptimize(Load(file.m_Path));
    }
    state.counters["bytes"] = static_cast<double>(size);
}
BENCHMARK(LoadBook)->ArgName("chapters")->Arg(100)->Arg(10'000)->Unit(benchmark::kMillisecond);

/// Flushing file and folder to the disk is part of it; each save changes the file.
void SaveBook(benchmark::State & state)
{
    File const file;
    WriteBook(file.m_Path, static_cast<int>(state.range(0)));
    Counted<BookController> const book = Load(file.m_Path);
    int page = 0;
    for (auto _ : state) {
        book->GetChapterAtIndex(0)->SetStartFromPage(++page);
        DocumentSaveResult saved;
        book->SaveBook(saved);
        if (!saved.IsSuccess()) {
            state.SkipWithError(saved.GetText().c_str());
            break;
        }
    }
}
BENCHMARK(SaveBook)->ArgName("chapters")->Arg(100)->Arg(10'000)->Unit(benchmark::kMillisecond);

}

BENCHMARK_MAIN();
