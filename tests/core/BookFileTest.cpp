#include "core/BookController.h"

#include "commands/ChapterOpenCommand.h"
#include "commands/PreflightChaptersCommand.h"
#include "content/SetMasterIndexCommand.h"
#include "core/BookCollection.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentSaveResult.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Archive.h"
#include "framework/kernel/ArchiveSession.h"
#include "framework/kernel/FileStore.h"
#include "framework/kernel/FileStoreCompressionHint.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/MemoryStreams.h"
#include "framework/kernel/OutSerialiserFile.h"
#include "framework/raster/DynamicBitmap.h"
#include "framework/story/Index.h"
#include "support/BookBuilder.h"

#include <gtest/gtest.h>

#include <fstream>
#include <functional>

using Book::BookChapter;
using Book::BookCollection;
using Book::BookController;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

/// An item that writes whatever a test wants to find in a book file.
class FreeItem final : public Kernel::FileStoreItem
{
public:
    using Writer = std::function<void(Kernel::OutStream &, Kernel::FileStoreOut &)>;
    explicit FreeItem(Writer writer) : m_Writer(std::move(writer)) {}

    void Save(Kernel::OutStream & stream, Kernel::FileStoreOut & store) const override { m_Writer(stream, store); }
    bool Load(Kernel::InStream &, Kernel::FileStore &) override { return false; }
    [[nodiscard]] Kernel::FileStoreItemType const & GetObjectFileStoreItemType() const override
    {
        return BookController::GetTypeFileStoreItemType();
    }

private:
    Writer m_Writer;
};

/// Writes an archive of a type with one item.
void WriteArchive(String const & path, Kernel::IDTag type, char const * itemName, FreeItem::Writer const & writer)
{
    Kernel::Archive::CreateResult created;
    auto const archive = Kernel::Archive::CreateWithTemporary(path, type, created);
    ASSERT_TRUE(archive) << created.m_Text;
    Kernel::ArchiveSessionHandle session;
    ASSERT_EQ(archive->CreateSessionAdv(session, Kernel::Archive::SessionType::Whole, nullptr, false),
              Kernel::Archive::SessionResult::Success);
    Kernel::FileStoreCompressionHintGeneral const hint(
        Kernel::FileStoreCompressionHintGeneral::CompressionLevel::Stored, Kernel::CompressionPredictorType::None, 0);
    session->SaveFile(itemName, hint, FreeItem(writer));
    archive->CloseSession(session, false);
}

/// A tagged stream of a book with the fields that `fields` writes.
FreeItem::Writer BookStream(std::function<void(Kernel::OutSerialiser &)> fields)
{
    return [fields = std::move(fields)](Kernel::OutStream & stream, Kernel::FileStoreOut & store) {
        Kernel::OutSerialiserFile out(stream, store, "Book", 1);
        fields(out);
        out.Close();
    };
}

/// A class that is no chapter, and one whose version is ahead of the program's.
class Stranger : public Kernel::Serialisable
{
public:
    void Save(Kernel::OutSerialiser &) const override {}
    bool Load(Kernel::InSerialiser const &, Kernel::FileStore &, unsigned short) override { return true; }
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override { return Properties; }
    static Counted<Kernel::Serialisable> Create() { return MakeCounted<Stranger>(); }
    static Kernel::ClassProperties const Properties;
};
Kernel::ClassProperties const Stranger::Properties("TsSt", &Stranger::Create, 1, {}, nullptr);
Kernel::ClassPropertiesBase::Init const s_StrangerInit(Stranger::Properties);

class FutureChapter final : public Stranger
{
public:
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override { return Ahead; }
    static Kernel::ClassProperties const Ahead;
};
Kernel::ClassProperties const FutureChapter::Ahead("BkCh", nullptr, 2, {}, nullptr);

/// Stands for a preview in a file with whatever fields a test gives it.
class ForgedBitmap final : public Stranger
{
public:
    using Writer = std::function<void(Kernel::OutSerialiser &)>;
    explicit ForgedBitmap(Writer fields) : m_Fields(std::move(fields)) {}
    void Save(Kernel::OutSerialiser & out) const override { m_Fields(out); }
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override { return Forged; }
    static Kernel::ClassProperties const Forged;

private:
    Writer m_Fields;
};
Kernel::ClassProperties const ForgedBitmap::Forged("DyBm", nullptr, 1, {}, nullptr);

class BookFileTest : public testing::Test
{
protected:
    /// Loads the file at `path` into a controller of its own.
    Counted<BookController> Load(String const & path)
    {
        m_Result = MakeCounted<OpenDocumentFailedNotification>(path, false);
        auto const book = MakeCounted<BookController>();
        m_Loaded = book->LoadBook(path, *m_Result);
        book->DisableCommandEnqueueAndEmpty();
        return book;
    }

    TemporaryFolder const m_Folder;
    bool m_Loaded = false;
    Counted<OpenDocumentFailedNotification> m_Result;
};

}

TEST_F(BookFileTest, KeepsChaptersAndSettings)
{
    String const path = m_Folder / "book.kvbook";
    auto const book = MakeCounted<BookController>();
    book->AddChapter("/nowhere/a.kvdoc", -1);
    book->AddChapter("/nowhere/b.kvdoc", -1);
    auto const second = book->GetChapterAtIndex(1);
    second->SetName("Ünder");
    second->SetPages("7 - 9");
    second->SetStartFromPage(7);
    second->SetHasEndnotesMarker(true);
    second->SetPassword("guid", "secret");
    second->SetStatus(BookChapter::Status::Locked);
    book->SetPadStrays(true);
    book->SetMergeStrays(false);
    book->SetSynchroniseSettings({true, false, true, false});
    book->SetPath("/elsewhere/before.kvbook");

    DocumentSaveResult saved;
    book->SaveBookAsCopy(saved, path);
    ASSERT_TRUE(saved.IsSuccess()) << saved.GetText();
    EXPECT_EQ(saved.GetResult(), 0);
    EXPECT_EQ(book->GetPath(), path) << "the book is at the new path";
    EXPECT_FALSE(book->IsDirty());

    auto const loaded = Load(path);
    ASSERT_TRUE(m_Loaded) << m_Result->GetReason();
    EXPECT_TRUE(m_Result->IsArchiveOpened());
    EXPECT_EQ(loaded->GetPath(), path);
    EXPECT_FALSE(loaded->IsDirty());
    EXPECT_EQ(BookBuilder::Names(*loaded), "a Ünder");
    auto const chapter = loaded->GetChapterAtIndex(1);
    EXPECT_EQ(chapter->GetPath(), "/nowhere/b.kvdoc");
    EXPECT_EQ(chapter->DescribePages(), "7 - 9");
    EXPECT_EQ(chapter->GetStartFromPage(), 7);
    EXPECT_TRUE(chapter->HasEndnotesMarker());
    EXPECT_TRUE(chapter->GetPassword("guid").Empty()) << "passwords stay in memory";
    EXPECT_EQ(chapter->GetStatus(), BookChapter::Status::Ok) << "nobody has looked yet";
    EXPECT_TRUE(loaded->GetChapterAtIndex(0)->IsKey());
    EXPECT_FALSE(chapter->IsKey());
    EXPECT_TRUE(loaded->IsPadStrays());
    EXPECT_FALSE(loaded->IsMergeStrays());
    EXPECT_EQ(loaded->GetSynchroniseSettings(), (BookController::SynchroniseSettings{true, false, true, false}));
}

TEST_F(BookFileTest, KeepsItsPreviewToTheBitInEveryPixelFormat)
{
    String const path = m_Folder / "book.kvbook";
    for (int const format : {0, 1, 2, 3, 4, 5, 6, 7, 9, 10}) {
        auto const bitmap = MakeCounted<Raster::DynamicBitmap>();
        bitmap->Create(37, 11, static_cast<Raster::Format>(format), Raster::MipmapMode::OnDemand,
                       Raster::HardwareCachePolicy::Default);
        // Every byte value turns up, so floats hold infinities and no-numbers, too.
        for (int y = 0; y < 11; ++y) {
            for (std::size_t i = 0; i < bitmap->GetRowBytes(); ++i) {
                bitmap->GetRow(y)[i] = static_cast<std::uint8_t>(i * i + static_cast<std::size_t>(y) * 91);
            }
        }
        auto const book = MakeCounted<BookController>();
        book->UpdateThumbnail(bitmap);
        DocumentSaveResult saved;
        book->SaveBookAsCopy(saved, path);
        ASSERT_TRUE(saved.IsSuccess()) << saved.GetText();
        auto const loaded = Load(path)->GetThumbnail();
        ASSERT_TRUE(loaded) << "format " << format;
        EXPECT_EQ(loaded->GetFormat(), bitmap->GetFormat());
        EXPECT_EQ(loaded->GetWidth(), 37);
        EXPECT_EQ(loaded->GetHeight(), 11);
        EXPECT_EQ(loaded->GetMipmapMode(), Raster::MipmapMode::OnDemand);
        EXPECT_EQ(loaded->GetPixels(), bitmap->GetPixels()) << "format " << format;
    }
}

TEST_F(BookFileTest, PacksAWhitePreviewIntoLittle)
{
    String const path = m_Folder / "book.kvbook";
    auto const bitmap = MakeCounted<Raster::DynamicBitmap>();
    bitmap->Create(724, 1024, Raster::Format::Rgba8, Raster::MipmapMode::OnDemand,
                   Raster::HardwareCachePolicy::Default);
    bitmap->Fill(Raster::DynamicPixel({255, 255, 255, 255}, Raster::Format::Rgba8));
    auto const book = MakeCounted<BookController>();
    book->UpdateThumbnail(bitmap);
    Kernel::MemoryOutStream stream;
    Kernel::CollectingFileStoreOut store(true);
    book->Save(stream, store);
    EXPECT_LT(stream.GetBytes().size(), 20000U);
    DocumentSaveResult saved;
    book->SaveBookAsCopy(saved, path);
    EXPECT_EQ(Load(path)->GetThumbnail()->GetPixels(), bitmap->GetPixels());
}

TEST_F(BookFileTest, RefusesAPreviewWhosePixelsDoNotFillItsSizeAndReadsTheRest)
{
    // Deflate's stored block of five bytes.
    std::vector<std::uint8_t> const five{0x01, 5, 0, 0xFA, 0xFF, 'a', 'b', 'c', 'd', 'e'};
    struct Row
    {
        char const * m_Why;
        int m_Format;
        int m_Width;
        int m_Height;
        std::vector<std::uint8_t> m_Packed;
        bool m_Good;
    };
    String const path = m_Folder / "forged.kvbook";
    for (Row const & row : {Row{"as it should be", 6, 5, 1, five, true},
                            Row{"no such format", 8, 5, 1, five, false},
                            Row{"a width below 0", 6, -5, -1, five, false},
                            Row{"more pixels than were packed", 6, 5, 2, five, false},
                            Row{"fewer", 6, 4, 1, five, false},
                            Row{"not packed at all", 6, 3, 1, {0xFF, 0xFF, 0xFF}, false},
                            Row{"no pixels for its size", 6, 3, 1, {}, false},
                            Row{"more than the packed bytes can hold", 9, 32767, 32767, five, false},
                            Row{"a side past every bound", 6, 2147483647, 1, five, false}}) {
        auto const forged = MakeCounted<ForgedBitmap>([&row](Kernel::OutSerialiser & out) {
            out.SaveType("frmt", row.m_Format);
            out.SaveType("wdth", row.m_Width);
            out.SaveType("hght", row.m_Height);
            out.SaveData("pixl", row.m_Packed);
        });
        WriteArchive(path, "KvBk", "doc.dat", BookStream([&forged](Kernel::OutSerialiser & out) {
                         out.SaveType("PStr", true);
                         out.SaveObject("Thum", Counted<Kernel::Serialisable>(forged), true);
                     }));
        auto const book = Load(path);
        EXPECT_TRUE(m_Loaded && book->IsPadStrays()) << row.m_Why;
        EXPECT_EQ(book->GetThumbnail() != nullptr, row.m_Good) << row.m_Why;
    }
}

TEST_F(BookFileTest, WritesItsFieldsInOneOrder)
{
    auto const book = MakeCounted<BookController>();
    book->AddChapter("/nowhere/a.kvdoc", -1);
    Kernel::MemoryOutStream stream;
    Kernel::CollectingFileStoreOut store(true);
    book->Save(stream, store);
    std::string const bytes(stream.GetBytes().begin(), stream.GetBytes().end());
    std::size_t at = 0;
    for (char const * const tag : {"Book", "Chps", "BkCh", "path", "page", "name", "isky", "sfpg", "endm", "lmod",
                                   "ExpO", "Indx", "PStr", "MStr", "SySw", "SyTb", "SyTx", "SyMs", "Thum", "MBok"}) {
        std::string const reversed(std::string_view(tag).rbegin(), std::string_view(tag).rend());
        std::size_t const found = std::min(bytes.find(tag, at), bytes.find(reversed, at));
        ASSERT_NE(found, std::string::npos) << tag << " is missing behind byte " << at;
        at = found + 4;
    }
}

TEST_F(BookFileTest, ReadsAnEmptyBookAndOneWithoutAnyField)
{
    String const path = m_Folder / "empty.kvbook";
    auto const book = MakeCounted<BookController>();
    DocumentSaveResult saved;
    book->SaveBookAsCopy(saved, path);
    EXPECT_EQ(Load(path)->ChapterCount(), 0);
    EXPECT_TRUE(m_Loaded);

    WriteArchive(path, "KvBk", "doc.dat", BookStream([](Kernel::OutSerialiser &) {}));
    auto const bare = Load(path);
    ASSERT_TRUE(m_Loaded);
    EXPECT_FALSE(bare->IsPadStrays());
    EXPECT_TRUE(bare->IsMergeStrays());
    EXPECT_EQ(bare->GetSynchroniseSettings(), BookController::SynchroniseSettings());
}

TEST_F(BookFileTest, KeepsThePlaceOfAnEntryThatIsNoChapter)
{
    String const path = m_Folder / "book.kvbook";
    WriteArchive(path, "KvBk", "doc.dat", BookStream([](Kernel::OutSerialiser & out) {
                     out.SaveObjects("Chps",
                                     std::vector<Counted<Kernel::Serialisable>>{
                                         MakeCounted<Stranger>(), MakeCounted<BookChapter>(String("/x/b.kvdoc"))});
                     out.SaveObject("Indx", Counted<Kernel::Serialisable>(MakeCounted<Stranger>()), true);
                 }));
    auto const book = Load(path);
    ASSERT_TRUE(m_Loaded);
    ASSERT_EQ(book->ChapterCount(), 2);
    EXPECT_EQ(book->GetChapterAtIndex(0), nullptr);
    EXPECT_EQ(book->GetMasterIndex(), nullptr);
    // And the list goes on working with the gap in it.
    EXPECT_EQ(book->GetChapterFromPath("/x/b.kvdoc"), book->GetChapterAtIndex(1));
    BookController::ConstChapterList chapters;
    book->GetChapters(chapters);
    EXPECT_EQ(chapters.size(), 1u) << "who walks over all chapters meets none that is not there";
    Kernel::MemoryOutStream stream;
    Kernel::CollectingFileStoreOut pathsOnly(false);
    book->Save(stream, pathsOnly);
    EXPECT_EQ(stream.GetPosition(), 0u) << "a run that collects paths writes nothing";
    book->SetPadStrays(true);
    DocumentSaveResult saved;
    book->SaveBook(saved);
    EXPECT_TRUE(saved.IsSuccess());
    EXPECT_EQ(Load(path)->GetChapterAtIndex(0), nullptr);
}

TEST_F(BookFileTest, ABookWithGapsIsWorkedOnLikeAnyOther)
{
    BookBuilder builder;
    String const a = builder.WriteChapter("a.kvdoc", {.m_Anchors = {"here"}, .m_Topics = {"Birds"}});
    String const b = builder.WriteChapter("b.kvdoc", {.m_Pages = 3, .m_Topics = {"Dogs"}});
    String const path = m_Folder / "book.kvbook";
    WriteArchive(path, "KvBk", "doc.dat", BookStream([&](Kernel::OutSerialiser & out) {
                     auto const key = MakeCounted<BookChapter>(a);
                     key->SetIsKey(true);
                     out.SaveObjects("Chps", std::vector<Counted<Kernel::Serialisable>>{
                                                 MakeCounted<Stranger>(), key, MakeCounted<Stranger>(),
                                                 MakeCounted<BookChapter>(b)});
                 }));
    auto const book = builder.LoadBook(path);
    ASSERT_TRUE(book);
    Counted<BookChapter const> const first = book->GetChapterAtIndex(1);
    Counted<BookChapter const> const last = book->GetChapterAtIndex(3);
    EXPECT_EQ(book->GetNextChapter(first), last);
    EXPECT_EQ(book->GetPreviousChapter(last), first);
    EXPECT_EQ(book->GetPreviousChapter(first), nullptr);
    EXPECT_EQ(book->GetNextChapter(last), nullptr);

    // With documents in front, whose topics and anchors the book then looks after.
    VantraController & application = VantraController::GetInstance();
    OpenDocumentFailedNotification failure(b, true);
    Counted<DocumentController const> const document = application.OpenDocument(b, failure);
    BookBuilder::Rest();
    BookBuilder::Run(book, MakeCounted<Book::SetMasterIndexCommand>(MakeCounted<Story::Index>()));
    BookBuilder::Run(book, MakeCounted<Book::ChapterOpenCommand>(document));
    book->UpdateChapters();
    BookCollection::GetInstance().PreOutput(book, {first, last});
    BookBuilder::Run(book, MakeCounted<Book::PreflightChaptersCommand>(
                               BookController::ConstChapterList{first, last}, true));
    application.EnqueueCommandAndWait(MakeCounted<CloseDocumentCommand>(document, nullptr, true, false));
    BookBuilder::Rest();
    EXPECT_EQ(last->GetCachedStartPage(), 2) << "numbered on from the chapter before the gap";

    book->MoveChapters(first, {last});
    EXPECT_EQ(BookBuilder::Names(*book), "b a");
    book->RemoveChapters({first});
    EXPECT_TRUE(last->IsKey()) << "the first chapter that remains";
    EXPECT_EQ(last->GetStartFromPage(), last->GetCachedStartPage());
}

TEST_F(BookFileTest, TellsWhyAFileCannotBeOpened)
{
    String const good = m_Folder / "good.kvbook";
    DocumentSaveResult saved;
    auto const book = MakeCounted<BookController>();
    book->AddChapter("/nowhere/a.kvdoc", -1);
    book->SaveBookAsCopy(saved, good);
    std::string const whole = m_Folder.ReadFile("good.kvbook");

    m_Folder.WriteFile("text.kvbook", "This is no book.");
    m_Folder.WriteFile("cut.kvbook", whole.substr(0, whole.size() / 2));
    String const foreign = m_Folder / "foreign.kvbook";
    WriteArchive(foreign, "KvDc", "doc.dat", BookStream([](Kernel::OutSerialiser &) {}));
    String const noItem = m_Folder / "noitem.kvbook";
    WriteArchive(noItem, "KvBk", "other.dat", BookStream([](Kernel::OutSerialiser &) {}));
    String const noStream = m_Folder / "nostream.kvbook";
    WriteArchive(noStream, "KvBk", "doc.dat", [](Kernel::OutStream & stream, Kernel::FileStoreOut &) {
        stream.Write("no tagged stream at all", 23);
    });
    String const future = m_Folder / "future.kvbook";
    WriteArchive(future, "KvBk", "doc.dat", BookStream([](Kernel::OutSerialiser & out) {
                     out.SaveObjects("Chps", std::vector<Counted<Kernel::Serialisable>>{MakeCounted<FutureChapter>()});
                 }));
    String const damaged = m_Folder / "damaged.kvbook";
    WriteArchive(damaged, "KvBk", "doc.dat", [&](Kernel::OutStream & stream, Kernel::FileStoreOut & store) {
        Kernel::MemoryOutStream memory;
        book->Save(memory, store);
        stream.Write(memory.GetBytes().data(), memory.GetBytes().size() - 9);
    });

    struct Row
    {
        char const * m_Name;
        int m_Code;
        bool m_ArchiveOpened;
    };
    using Failed = OpenDocumentFailedNotification;
    for (Row const & row :
         {Row{"missing.kvbook", Failed::FileNotFound, false}, Row{"text.kvbook", Failed::NotADocument, false},
          Row{"foreign.kvbook", Failed::OtherFileType, false}, Row{"noitem.kvbook", 12, true},
          Row{"nostream.kvbook", 12, true}, Row{"future.kvbook", 16, true}, Row{"damaged.kvbook", 17, true}}) {
        auto const failed = Load(m_Folder / row.m_Name);
        EXPECT_FALSE(m_Loaded) << row.m_Name;
        EXPECT_EQ(m_Result->GetResult(), row.m_Code) << row.m_Name;
        EXPECT_EQ(m_Result->IsArchiveOpened(), row.m_ArchiveOpened) << row.m_Name;
        EXPECT_FALSE(m_Result->GetReason().Empty()) << row.m_Name << ": the user is told why";
        EXPECT_TRUE(failed->GetPath().Empty()) << row.m_Name;
    }
    Load(m_Folder / "cut.kvbook");
    EXPECT_FALSE(m_Loaded);
    EXPECT_TRUE(m_Result->GetResult() == Failed::Truncated || m_Result->GetResult() == Failed::Corrupt)
        << m_Result->GetResult();
}

TEST_F(BookFileTest, ASaveThatFailsLeavesBookAndFileAsTheyWere)
{
    String const path = m_Folder / "book.kvbook";
    auto const book = MakeCounted<BookController>();
    DocumentSaveResult saved;
    book->SaveBookAsCopy(saved, path);
    std::string const before = m_Folder.ReadFile("book.kvbook");
    book->AddChapter("/nowhere/a.kvdoc", -1);

    DocumentSaveResult failed;
    book->SaveBookAsCopy(failed, m_Folder / "no such folder/book.kvbook");
    EXPECT_FALSE(failed.IsSuccess());
    EXPECT_TRUE(failed.ConcernsFile());
    EXPECT_EQ(failed.GetResult(), 28);
    EXPECT_FALSE(failed.GetText().Empty());
    EXPECT_EQ(book->GetPath(), path);
    EXPECT_TRUE(book->IsDirty());
    EXPECT_EQ(m_Folder.ReadFile("book.kvbook"), before);

    // A folder stands where the file should go.
    DocumentSaveResult onFolder;
    book->SaveBookAsCopy(onFolder, m_Folder.GetPath());
    EXPECT_EQ(onFolder.GetResult(), 30);
    EXPECT_TRUE(book->IsDirty());
}
