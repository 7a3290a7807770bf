#include "core/BookController.h"
#include "framework/kernel/Exception.h"
#include "framework/kernel/FileStore.h"
#include "framework/kernel/MemoryStreams.h"
#include "framework/kernel/RawData.h"
#include "framework/raster/DynamicBitmap.h"

#include <cstdlib>

using namespace Kernel;

namespace
{

Counted<RawData const> WriteBook(Book::BookController const & book)
{
    MemoryOutStream stream;
    CollectingFileStoreOut store(true);
    book.Save(stream, store);
    return MakeCounted<RawData>(RawData::Bytes(stream.GetBytes().begin(), stream.GetBytes().end()));
}

bool ReadBook(Book::BookController & book, Counted<RawData const> const & bytes)
{
    EmptyFileStore store;
    MemoryInStream stream(bytes, "book");
    return book.Load(stream, store);
}

}

/// The content of a book file: reads it, walks the list, gaps and all, and what it writes then reads back the same.
extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const * data, std::size_t size)
{
    auto const bytes = MakeCounted<RawData>(RawData::Bytes(data, data + size));
    auto const book = MakeCounted<Book::BookController>();
    try {
        if (!ReadBook(*book, bytes)) {
            return 0;
        }
    } catch (Exception const &) {
        return 0;
    }
    Book::BookController::ConstChapterList chapters;
    book->GetChapters(chapters);
    for (Counted<Book::BookChapter const> const & chapter : chapters) {
        if (chapter && (book->IndexFromChapter(chapter) < 0 || !book->ContainsChapter(chapter->GetPath()))) {
            std::abort();
        }
    }
    static_cast<void>(book->GetKeyChapter(true));
    book->MoveChapters(nullptr, {book->GetChapterAtIndex(0)});
    book->OnFirstChapterChanged();

    auto const written = WriteBook(*book);
    auto const again = MakeCounted<Book::BookController>();
    if (!ReadBook(*again, written) || again->ChapterCount() != book->ChapterCount()) {
        std::abort();
    }
    auto const preview = book->GetThumbnail();
    auto const previewAgain = again->GetThumbnail();
    if ((preview == nullptr) != (previewAgain == nullptr) ||
        (preview && (preview->GetWidth() != previewAgain->GetWidth() ||
                     preview->GetPixels() != previewAgain->GetPixels()))) {
        std::abort();
    }
    return 0;
}
