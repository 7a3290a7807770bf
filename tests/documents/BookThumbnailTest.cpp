#include "commands/UpdateChapterCommand.h"
#include "core/BookCollection.h"
#include "framework/commands/ComposeTextCommand.h"
#include "framework/commands/StoryCommands.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentSaveResult.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/document/Selection.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Archive.h"
#include "framework/raster/DynamicBitmap.h"
#include "framework/raster/Picture.h"
#include "support/BookBuilder.h"
#include "support/DocumentBuilder.h"

#include <gtest/gtest.h>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

class BookThumbnailTest : public testing::Test
{
protected:
    BookThumbnailTest() { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false); }
    ~BookThumbnailTest() override
    {
        VantraController::GetInstance().SetPreviewsWanted(true);
        BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true);
    }

    String WriteChapter(char const * name)
    {
        ChapterSketch sketch;
        sketch.m_Title = name;
        sketch.m_Pages = 2;
        return m_Builder.WriteChapter(name, sketch);
    }

    /// Saves the book and gives the picture in its file; null if there is none.
    Counted<Raster::DynamicBitmap const> SavedPicture(Counted<BookController> const & book)
    {
        DocumentSaveResult saved;
        book->SaveBookAsCopy(saved, m_Path);
        EXPECT_TRUE(saved.IsSuccess()) << saved.GetText();
        auto opened = Kernel::Archive::OpenResult::Success;
        auto const archive = Kernel::Archive::Open(m_Path, Kernel::Archive::OpenMode::ReadUnlocked, "KvBk", opened);
        if (!archive || !archive->HasItem("Thumbnails/thumbnail.png")) {
            return nullptr;
        }
        auto const png = archive->ReadItem("Thumbnails/thumbnail.png");
        Raster::PictureProblem problem;
        auto const picture = Raster::Picture::FromBytes(
            std::make_shared<std::vector<unsigned char>>(png->GetData(), png->GetData() + png->GetSize()), "png", problem);
        EXPECT_TRUE(picture) << problem.m_Text;
        return picture ? picture->Decode(problem) : nullptr;
    }

    static std::vector<int> PixelAt(Raster::DynamicBitmap const & bitmap, int x, int y)
    {
        std::uint8_t const * const pixel = bitmap.GetRow(y) + 4 * x;
        return {pixel, pixel + 4};
    }

    static Counted<Raster::DynamicBitmap> Red(int width, int height)
    {
        auto const bitmap = MakeCounted<Raster::DynamicBitmap>();
        bitmap->Create(width, height, Raster::Format::Rgba8, Raster::MipmapMode::OnDemand,
                       Raster::HardwareCachePolicy::Default);
        // The left half is red, the other one nothing.
        for (int y = 0; y < height; ++y) {
            for (int x = 0; x < width / 2; ++x) {
                bitmap->GetRow(y)[4 * x] = 255;
                bitmap->GetRow(y)[4 * x + 3] = 255;
            }
        }
        return bitmap;
    }

    BookBuilder m_Builder;
    String const m_Path = m_Builder.GetFolder() / "book.kvbook";
};

}

TEST_F(BookThumbnailTest, TheBookFileShowsTheFirstSpreadOfTheKeyChapter)
{
    auto const book = m_Builder.NewBook();
    EXPECT_FALSE(SavedPicture(book)) << "nothing to show yet";
    String const first = WriteChapter("a.kvdoc");
    book->AddChapter(first, -1);
    book->AddChapter(WriteChapter("b.kvdoc"), -1);
    auto const picture = SavedPicture(book);
    ASSERT_TRUE(picture);
    // A5: 419.528 by 595.276 points.
    EXPECT_EQ(picture->GetWidth(), 360);
    EXPECT_EQ(picture->GetHeight(), 512);
    EXPECT_EQ(PixelAt(*picture, 2, 2), (std::vector<int>{255, 255, 255, 255}));
    int ink = 0;
    for (int y = 0; y < picture->GetHeight(); ++y) {
        for (int x = 0; x < picture->GetWidth(); ++x) {
            ASSERT_EQ(PixelAt(*picture, x, y)[3], 255);
            ink += PixelAt(*picture, x, y)[0] < 160 ? 1 : 0;
        }
    }
    EXPECT_GT(ink, 20) << "its text";

    // A later update of a chapter that nobody has in front leaves what the book has.
    auto const before = book->GetThumbnail();
    BookBuilder::Run(book, MakeCounted<UpdateChapterCommand>(book->GetChapterAtIndex(0)));
    EXPECT_EQ(book->GetThumbnail(), before);

    // Loaded and saved without a look at its chapters it still has its picture.
    auto const loaded = MakeCounted<BookController>();
    auto const result = MakeCounted<OpenDocumentFailedNotification>(m_Path, false);
    ASSERT_TRUE(loaded->LoadBook(m_Path, *result));
    loaded->DisableCommandEnqueueAndEmpty();
    auto const again = SavedPicture(loaded);
    ASSERT_TRUE(again);
    EXPECT_EQ(again->GetPixels(), picture->GetPixels());
}

TEST_F(BookThumbnailTest, ThePictureTakesTheShapeAndGroundOfTheRecord)
{
    auto const book = m_Builder.NewBook();
    book->AddChapter(WriteChapter("a.kvdoc"), -1);
    book->UpdateThumbnail(Red(20, 20));
    auto const key = book->GetMutableChapter(book->GetChapterAtIndex(0));
    struct Row
    {
        Kernel::Rect m_Bounds;
        bool m_Transparent;
        int m_Width;
        int m_Height;
    };
    for (Row const & row : {Row{{0, 0, 300, 600}, false, 256, 512}, Row{{-100, 0, 500, 300}, true, 512, 256},
                            Row{{0, 0, 300, 300}, false, 512, 512}, Row{{0, 0, 5000, 3}, false, 0, 0},
                            Row{{0, 0, 3, 5000}, false, 0, 0}, Row{Kernel::Rect::Empty(), false, 0, 0}}) {
        SpreadInfo spread;
        spread.m_SpreadBounds = row.m_Bounds;
        spread.m_SpreadFlag = row.m_Transparent;
        key->SetSpreadInfo({spread, SpreadInfo()});
        auto const picture = SavedPicture(book);
        ASSERT_EQ(picture != nullptr, row.m_Width > 0) << row.m_Bounds.right << " by " << row.m_Bounds.bottom;
        if (picture) {
            EXPECT_EQ(picture->GetWidth(), row.m_Width);
            EXPECT_EQ(picture->GetHeight(), row.m_Height);
            EXPECT_EQ(PixelAt(*picture, row.m_Width / 2 - 20, 10), (std::vector<int>{255, 0, 0, 255}));
            EXPECT_EQ(PixelAt(*picture, row.m_Width / 2 + 20, 10),
                      row.m_Transparent ? (std::vector<int>{0, 0, 0, 0}) : (std::vector<int>{255, 255, 255, 255}));
        }
    }
}

TEST_F(BookThumbnailTest, NoPictureWithoutKeyChapterOrWish)
{
    auto const book = m_Builder.NewBook();
    book->AddChapter(WriteChapter("a.kvdoc"), -1);
    VantraController::GetInstance().SetPreviewsWanted(false);
    EXPECT_FALSE(SavedPicture(book)) << "nobody wants one";
    VantraController::GetInstance().SetPreviewsWanted(true);
    EXPECT_TRUE(SavedPicture(book));

    // The next key chapter brings its own picture, and the last one takes it away.
    book->AddChapter(WriteChapter("b.kvdoc"), -1);
    auto const before = book->GetThumbnail();
    book->RemoveChapters({book->GetChapterAtIndex(0)});
    EXPECT_TRUE(book->GetThumbnail());
    EXPECT_NE(book->GetThumbnail(), before);
    book->RemoveChapters({book->GetChapterAtIndex(0)});
    EXPECT_FALSE(SavedPicture(book));
}

TEST_F(BookThumbnailTest, FollowsTheFirstSpreadOfTheKeyChapterWhileItIsInFront)
{
    String const key = WriteChapter("a.kvdoc");
    String const other = WriteChapter("b.kvdoc");
    auto const book = m_Builder.NewBook({key, other});
    VantraController & application = VantraController::GetInstance();
    OpenDocumentFailedNotification failure(key, true);
    auto const document = application.OpenDocument(key, failure);
    auto const otherDocument = application.OpenDocument(other, failure);
    ASSERT_TRUE(document && otherDocument);
    BookBuilder::Rest();
    ASSERT_TRUE(document->GetDocumentCacheBitmap(0, false));
    EXPECT_EQ(book->GetThumbnail(), document->GetDocumentCacheBitmap(0, false));

    auto const edit = [&application](auto const & edited) {
        application.EnqueueCommandAndWait(
            MakeCounted<InsertTextCommand>("More. ",
                                           MakeCounted<Selection>(edited->GetDocument()->GetMainFlow(), 0, 0)),
            edited, false);
        application.EnqueueCommandAndWait(MakeCounted<ComposeTextCommand>(false, nullptr), edited, false);
        BookBuilder::Rest();
    };
    auto const before = book->GetThumbnail();
    edit(otherDocument);
    EXPECT_EQ(book->GetThumbnail(), before) << "no style source";
    edit(document);
    EXPECT_NE(book->GetThumbnail(), before);
    EXPECT_EQ(book->GetThumbnail(), document->GetDocumentCacheBitmap(0, false));
    for (auto const & open : {document, otherDocument}) {
        application.EnqueueCommandAndWait(
            Counted<VantraCommand>(MakeCounted<CloseDocumentCommand>(open, nullptr, false, false)));
    }
}

TEST_F(BookThumbnailTest, FollowsThePreviewInTheKeyChaptersFile)
{
    String const path = m_Builder.GetFolder() / "key.kvdoc";
    auto const write = [&path](int paragraphs) {
        auto const document = DocumentBuilder().Paragraphs(paragraphs).Build();
        document->KeepCacheBitmap();
        SaveTestDocument(*document, path);
        document->ShutDownArchive();
    };
    write(1);
    auto const book = m_Builder.NewBook({path});
    auto const before = SavedPicture(book);
    ASSERT_TRUE(before);

    // Somebody has made the chapter's file anew; no window shows it.
    write(6);
    BookBuilder::Run(book, MakeCounted<UpdateChapterCommand>(book->GetChapterAtIndex(0)));
    auto const after = SavedPicture(book);
    ASSERT_TRUE(after);
    EXPECT_NE(after->GetPixels(), before->GetPixels());
}
