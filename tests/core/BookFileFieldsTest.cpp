#include "core/BookController.h"

#include "framework/document/DocumentSaveResult.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/document/PDFBookmarkManager.h"
#include "framework/kernel/FileStore.h"
#include "framework/kernel/InSerialiserFile.h"
#include "framework/kernel/MemoryStreams.h"
#include "framework/kernel/OutSerialiserFile.h"
#include "framework/render/FileExportOptions.h"
#include "framework/story/AnchorData.h"
#include "framework/story/Index.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

using Book::BookController;
using Kernel::Counted;
using Kernel::MakeCounted;
using Renderer::FileExportOptionsPDF;

namespace
{

Counted<BookController> SaveAndLoad(BookController & book, TemporaryFolder const & folder)
{
    DocumentSaveResult saved;
    book.SaveBookAsCopy(saved, folder / "book.kvbook");
    EXPECT_TRUE(saved.IsSuccess()) << saved.GetText();
    auto const loaded = MakeCounted<BookController>();
    OpenDocumentFailedNotification failure(folder / "book.kvbook", false);
    EXPECT_TRUE(loaded->LoadBook(folder / "book.kvbook", failure)) << failure.GetReason();
    loaded->DisableCommandEnqueueAndEmpty();
    return loaded;
}

/// An object's class and fields, as a file would hold them.
std::vector<std::uint8_t> BytesOf(Kernel::Serialisable const & object)
{
    Kernel::CollectingFileStoreOut store(true);
    return Kernel::OutSerialiserMemory(store, nullptr).WriteWhole(object);
}

}

TEST(BookFileFieldsTest, KeepsEveryExportOption)
{
    FileExportOptionsPDF::Settings settings;
    settings.m_Hyperlinks = false;
    settings.m_Bookmarks = false;
    settings.m_PageLabels = false;
    settings.m_OpenBookmarkLevels = 3;
    settings.m_PrintersMarks.m_CropMarks = true;
    settings.m_PrintersMarks.m_RegistrationMarks = true;
    settings.m_PrintersMarks.m_Offset = 9.25;
    settings.m_PrintersMarks.m_Length = 17;
    settings.m_PrintersMarks.m_LineWidth = 0.5;
    settings.m_PictureDpiLimit = 300;
    settings.m_PictureDpiWarning = 150;
    settings.m_Keep16Bit = false;
    settings.m_OutputIntent = false;
    settings.m_Language = "de-AT";
    settings.m_FixedTime = 1'700'000'000;
    auto const options = MakeCounted<FileExportOptionsPDF>();
    options->SetSettings(settings);
    options->SetIncludeBleed(true);
    options->SetEmbedMetadata(false);
    TemporaryFolder const folder;
    auto const book = MakeCounted<BookController>();
    book->SetExportOptions(Kernel::Consolidated<Renderer::FileExportOptions>(options));

    auto const loaded = SaveAndLoad(*book, folder)->GetExportOptions();
    ASSERT_TRUE(loaded);
    auto const pdf = Kernel::CountedCast<FileExportOptionsPDF const>(loaded.GetCounted());
    ASSERT_TRUE(pdf);
    EXPECT_TRUE(pdf->GetIncludeBleed());
    EXPECT_FALSE(pdf->GetEmbedMetadata());
    FileExportOptionsPDF::Settings const & got = pdf->GetSettings();
    EXPECT_FALSE(got.m_Hyperlinks || got.m_Bookmarks || got.m_PageLabels || got.m_Keep16Bit || got.m_OutputIntent);
    EXPECT_EQ(got.m_OpenBookmarkLevels, 3);
    EXPECT_EQ(got.m_PrintersMarks, settings.m_PrintersMarks);
    EXPECT_EQ(got.m_PictureDpiLimit, 300);
    EXPECT_EQ(got.m_PictureDpiWarning, 150);
    EXPECT_EQ(got.m_Language, "de-AT");
    EXPECT_EQ(got.m_FixedTime, settings.m_FixedTime);
    // A field that is added later and not written would show here.
    EXPECT_EQ(BytesOf(*pdf), BytesOf(*options));
}

TEST(BookFileFieldsTest, KeepsTheMasterIndexWithTopicsAndIdentities)
{
    TemporaryFolder const folder;
    auto const index = MakeCounted<Story::Index>();
    char const nested[] = {'R', 'i', 'v', 'e', 'r', 's', Story::IndexTopic::NameSeparator, 'M', 'a', 'i', 'n', 0};
    index->EnsureTopic("Rivers");
    index->EnsureTopic(nested);
    index->EnsureTopic("Ängste");
    auto const book = MakeCounted<BookController>();
    book->SetMasterIndex(index);
    auto const before = book->GetMasterIndex();
    ASSERT_TRUE(before);
    auto const after = SaveAndLoad(*book, folder)->GetMasterIndex();
    ASSERT_TRUE(after);
    ASSERT_EQ(after->GetTopicCount(), 3u);
    EXPECT_TRUE(after->TopicsContainGUIDs());
    for (auto const & topic : *before) {
        auto const same = after->FindTopicByGUID(topic->GetGUID());
        ASSERT_TRUE(same) << topic->GetName();
        EXPECT_EQ(same->GetNameWithParents(), topic->GetNameWithParents());
        EXPECT_EQ(same->GetSortString(), topic->GetSortString());
    }
}

TEST(BookFileFieldsTest, KeepsBookmarks)
{
    auto const manager = MakeCounted<PDFBookmarkManager>();
    manager->Add(MakeCounted<Story::AnchorData>("Über", true, true, "uid-1", 2));
    manager->Add(MakeCounted<Story::AnchorData>("Second", true, false, "uid-2", 0));
    // As a book that learnt them would be found on the disk.
    Kernel::MemoryOutStream stream;
    Kernel::CollectingFileStoreOut store(true);
    Kernel::OutSerialiserFile out(stream, store, "Book", 1);
    out.SaveObject("MBok", manager, true);
    out.Close();
    Kernel::MemoryInStream in(stream.RelinquishOwnership(), "book");
    auto const book = MakeCounted<BookController>();
    ASSERT_TRUE(book->Load(in, *MakeCounted<Kernel::EmptyFileStore>()));

    TemporaryFolder const folder;
    auto const bookmarks = SaveAndLoad(*book, folder)->GetPDFBookmarks();
    ASSERT_TRUE(bookmarks);
    ASSERT_EQ(bookmarks->GetCount(), 2u);
    auto const first = bookmarks->GetDataFromUid("uid-1");
    ASSERT_TRUE(first);
    EXPECT_EQ(first->GetName(), "Über");
    EXPECT_TRUE(first->IsPDFBookmark() && first->IsTOCEntry());
    EXPECT_EQ(first->GetLevel(), 2);
    EXPECT_FALSE(bookmarks->GetDataFromUid("uid-2")->IsTOCEntry());
}
