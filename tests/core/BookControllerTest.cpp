#include "core/BookController.h"
#include "framework/raster/DynamicBitmap.h"
#include "support/BookBuilder.h"

#include <gtest/gtest.h>

using Book::BookChapter;
using Book::BookController;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

/// A book of chapters whose files do not exist, which the list does not mind. They count as found where a test wants
/// it.
class BookOfNoFiles
{
public:
    BookOfNoFiles()
    {
        for (char const * const path :
             {"/nowhere/a.kvdoc", "/nowhere/b.kvdoc", "/nowhere/c.kvdoc", "/nowhere/d.kvdoc"}) {
            m_Book->AddChapter(path, -1);
        }
        SetAllStatus(BookChapter::Status::Ok);
        m_Book->SetIsDirty(false);
    }

    void SetAllStatus(BookChapter::Status status)
    {
        for (int index = 0; index < m_Book->ChapterCount(); ++index) {
            m_Book->GetChapterAtIndex(index)->SetStatus(status);
        }
    }

    [[nodiscard]] Counted<BookChapter> At(int index) { return m_Book->GetChapterAtIndex(index); }
    [[nodiscard]] std::string Names() const { return BookBuilder::Names(*m_Book); }
    [[nodiscard]] std::string Starts() const { return BookBuilder::Starts(*m_Book); }
    /// Names of the chapters that carry the key flag.
    [[nodiscard]] std::string Keys()
    {
        std::string keys;
        for (int index = 0; index < m_Book->ChapterCount(); ++index) {
            keys += At(index)->IsKey() ? At(index)->GetName().ToStd() : "";
        }
        return keys;
    }
    void GiveThumbnail() { m_Book->UpdateThumbnail(MakeCounted<Raster::DynamicBitmap>()); }

    Counted<BookController> const m_Book = MakeCounted<BookController>();
};

class BookControllerTest : public testing::Test, public BookOfNoFiles
{
};

}

TEST_F(BookControllerTest, FindsChaptersAndTheirNeighbours)
{
    Counted<BookChapter const> const stranger = MakeCounted<BookChapter>(String("/nowhere/a.kvdoc"));
    EXPECT_EQ(m_Book->ChapterCount(), 4);
    EXPECT_EQ(At(-1), nullptr);
    EXPECT_EQ(At(4), nullptr);
    EXPECT_EQ(m_Book->IndexFromChapter(At(2)), 2);
    EXPECT_EQ(m_Book->IndexFromChapter(stranger), -1) << "the same path is not the same chapter";
    EXPECT_EQ(m_Book->IndexFromChapter(nullptr), -1);
    EXPECT_EQ(m_Book->GetMutableChapter(stranger), nullptr);
    EXPECT_EQ(m_Book->GetNextChapter(At(3)), nullptr);
    EXPECT_EQ(m_Book->GetNextChapter(At(0)), At(1));
    EXPECT_EQ(m_Book->GetNextChapter(stranger), nullptr);
    EXPECT_EQ(m_Book->GetPreviousChapter(At(0)), nullptr);
    EXPECT_EQ(m_Book->GetPreviousChapter(At(3)), At(2));
    EXPECT_EQ(m_Book->GetChapterFromPath("/nowhere/c.kvdoc"), At(2));
    EXPECT_FALSE(m_Book->ContainsChapter("/nowhere/C.kvdoc")) << "paths are compared byte for byte";

    BookController::ConstChapterList behind{stranger};
    m_Book->GetChaptersAfter(behind, At(1));
    EXPECT_EQ(behind.size(), 3u) << "appends c and d";
    m_Book->GetChaptersAfter(behind, stranger);
    EXPECT_EQ(behind.size(), 3u);
}

TEST_F(BookControllerTest, AddsAtAnyPlaceAndEachPathOnce)
{
    EXPECT_EQ(m_Book->AddChapter("/nowhere/b.kvdoc", 0), nullptr);
    EXPECT_EQ(Names(), "a b c d");
    EXPECT_FALSE(m_Book->IsDirty()) << "nothing has changed";
    m_Book->AddChapter("/nowhere/x.kvdoc", 2);
    m_Book->AddChapter("/nowhere/y.kvdoc", 99);
    m_Book->AddChapter("/nowhere/z.kvdoc", 0);
    EXPECT_EQ(Names(), "z a b x c d y");
    EXPECT_EQ(At(0)->GetStartFromPage(), 0);
    EXPECT_EQ(At(0)->GetStatus(), BookChapter::Status::NotFound);
    EXPECT_EQ(Keys(), "a") << "the first chapter that the book ever had";
    EXPECT_TRUE(m_Book->IsDirty());
}

TEST_F(BookControllerTest, MovesABlockInTheGivenOrder)
{
    struct Row
    {
        char const * m_Why;
        std::vector<int> m_Moved;
        int m_Before;
        int m_FirstStart;
        char const * m_Names;
        char const * m_Starts;
    };
    Row const rows[] = {
        {"to the end", {0, 1}, -1, 0, "c d a b", "0 0 0 0"},
        {"in the order given, not in the book's", {3, 1}, 0, 0, "d b a c", "0 0 0 0"},
        {"in front of one of its own: to the end", {1, 2}, 1, 0, "a d b c", "0 0 0 0"},
        {"page 1 stays with the first place", {2}, 0, 1, "c a b d", "1 0 0 0"},
        {"also when the first moves away", {0}, 2, 1, "b a c d", "1 0 0 0"},
        {"any other number stays with its chapter", {2}, 0, 5, "c a b d", "0 5 0 0"},
        {"where the first stays, nothing is handed on", {3}, 1, 1, "a d b c", "1 0 0 0"},
        {"nothing to move", {}, 0, 1, "a b c d", "1 0 0 0"},
    };
    for (Row const & row : rows) {
        BookOfNoFiles book;
        book.At(0)->SetStartFromPage(row.m_FirstStart);
        BookController::ConstChapterList moved;
        for (int const index : row.m_Moved) {
            moved.push_back(book.At(index));
        }
        book.m_Book->MoveChapters(book.At(row.m_Before), moved);
        EXPECT_EQ(book.Names(), row.m_Names) << row.m_Why;
        EXPECT_EQ(book.Starts(), row.m_Starts) << row.m_Why;
        EXPECT_TRUE(book.m_Book->IsDirty()) << row.m_Why;
    }
}

TEST_F(BookControllerTest, MovesNothingIfOneChapterIsAStranger)
{
    m_Book->MoveChapters(nullptr, {At(0), MakeCounted<BookChapter>(String("/nowhere/x.kvdoc"))});
    EXPECT_EQ(Names(), "a b c d");
    EXPECT_FALSE(m_Book->IsDirty());
}

TEST_F(BookControllerTest, RemovesAndLetsTheFirstChapterStartWhereItWas)
{
    At(0)->SetStartFromPage(3);
    for (int index = 0; index < 4; ++index) {
        At(index)->SetCachedStartPage(10 * index + 1);
    }
    m_Book->RemoveChapters({MakeCounted<BookChapter>(String("/nowhere/a.kvdoc"))});
    EXPECT_FALSE(m_Book->IsDirty()) << "a stranger is passed over";
    EXPECT_EQ(Starts(), "1 0 0 0") << "the first chapter is looked at in every case";
    m_Book->RemoveChapters({At(0), At(2)});
    EXPECT_EQ(Names(), "b d");
    EXPECT_EQ(Starts(), "11 0");
    EXPECT_TRUE(m_Book->IsDirty());
    m_Book->RemoveChapters({At(0), At(1)});
    EXPECT_FALSE(m_Book->HasChapters());
}

TEST_F(BookControllerTest, HandsTheKeyOnWhenTheKeyChapterGoes)
{
    GiveThumbnail();
    m_Book->RemoveChapters({At(2)});
    EXPECT_NE(m_Book->GetThumbnail(), nullptr) << "another chapter's going leaves the preview";
    At(1)->SetStatus(BookChapter::Status::NotFound);
    m_Book->RemoveChapters({At(0)});
    EXPECT_EQ(Keys(), "b") << "the first that remains, valid or not";
    EXPECT_EQ(m_Book->GetThumbnail(), nullptr);
}

TEST_F(BookControllerTest, LooksForAKeyChapterThatIsValid)
{
    EXPECT_EQ(m_Book->GetKeyChapter(false), At(0));
    At(0)->SetStatus(BookChapter::Status::Locked);
    EXPECT_EQ(m_Book->GetKeyChapter(false), nullptr);
    EXPECT_EQ(m_Book->GetKeyChapter(true), At(1)) << "falls back on the first valid one";
    EXPECT_TRUE(m_Book->HasValidKeyChapter());

    GiveThumbnail();
    m_Book->SetKeyChapter(At(2));
    EXPECT_EQ(Keys(), "ac") << "the flag of a chapter that is not valid stays";
    EXPECT_EQ(m_Book->GetThumbnail(), nullptr);
    EXPECT_TRUE(m_Book->IsDirty());
    At(0)->SetStatus(BookChapter::Status::OutOfDate);
    At(2)->SetStatus(BookChapter::Status::Ok);
    EXPECT_EQ(m_Book->GetKeyChapter(false), At(0)) << "of two, the first valid one";

    SetAllStatus(BookChapter::Status::NotFound);
    EXPECT_EQ(m_Book->GetKeyChapter(true), nullptr);
    EXPECT_FALSE(m_Book->HasValidKeyChapter());
    EXPECT_FALSE(m_Book->ContainsValidChapters());
}

TEST_F(BookControllerTest, ReplacesAChapterByAFreshRecord)
{
    Counted<BookChapter> const old = At(0);
    old->SetStartFromPage(7);
    old->SetPassword("guid", "secret");
    auto const replacement = m_Book->ReplaceChapter(old, "/nowhere/x.kvdoc");
    EXPECT_EQ(Names(), "x b c d");
    EXPECT_EQ(At(0), replacement);
    EXPECT_EQ(Keys(), "x");
    EXPECT_EQ(replacement->GetStartFromPage(), 0);
    EXPECT_TRUE(replacement->GetPassword("guid").Empty());
    m_Book->SetIsDirty(false);
    EXPECT_EQ(m_Book->ReplaceChapter(old, "/nowhere/y.kvdoc"), nullptr) << "it is no longer in the book";
    EXPECT_FALSE(m_Book->IsDirty());
}

TEST_F(BookControllerTest, IsNamedAfterItsFileOrUntitled)
{
    struct Row
    {
        char const * m_Path;
        int m_Number;
        bool m_Mark;
        bool m_Dirty;
        char const * m_Name;
    };
    for (Row const & row :
         {Row{"", 1, true, false, "Untitled"}, Row{"", 2, false, true, "Untitled 2"},
          Row{"", 2, true, true, "Untitled 2 [Modified]"}, Row{"c:\\x\\a.b.ext", 1, true, true, "a.b [Modified]"},
          Row{"c:\\x\\a.b.ext", 1, false, true, "a.b"},
          Row{"/books/100%1.kvbook", 1, true, true, "100%1 [Modified]"}}) {
        m_Book->SetPath(row.m_Path);
        m_Book->SetIsDirty(row.m_Dirty);
        EXPECT_EQ(m_Book->GetName(row.m_Number, row.m_Mark), row.m_Name) << row.m_Path;
    }
}

TEST_F(BookControllerTest, AsksToBeSavedForWorkAndNotForSettings)
{
    EXPECT_TRUE(m_Book->CanSave()) << "a book without a file can always be saved";
    m_Book->SetPath("/books/b.kvbook");
    EXPECT_FALSE(m_Book->CanSave());
    m_Book->SetPadStrays(true);
    m_Book->SetMergeStrays(false);
    m_Book->SetSynchroniseSettings({false, false, false, false});
    GiveThumbnail();
    EXPECT_FALSE(m_Book->CanSave());
    m_Book->SetExportOptions(nullptr);
    EXPECT_TRUE(m_Book->CanSave());
}

TEST_F(BookControllerTest, FindsIndexAndEndnotesMarkerAndEstrangedChapters)
{
    EXPECT_EQ(m_Book->GetChapterWithIndex(), nullptr);
    EXPECT_FALSE(m_Book->HasEndnotesMarker());
    EXPECT_FALSE(m_Book->ContainsEstrangedChapters());
    At(1)->SetContainsIndex(true);
    At(2)->SetHasEndnotesMarker(true);
    At(3)->SetStatus(BookChapter::Status::OpenForEdit);
    EXPECT_EQ(m_Book->GetChapterWithIndex(), At(1));
    EXPECT_EQ(m_Book->GetChapterWithEndnotesMarker(), At(2));
    EXPECT_TRUE(m_Book->ContainsEstrangedChapters()) << "nobody has it open";
}

TEST_F(BookControllerTest, AChapterWhoseFileNeverOpenedSaysWhatANewDocumentWould)
{
    Counted<BookChapter const> const chapter = At(1);
    EXPECT_EQ(chapter->GetColourFormat(), Raster::Format::Rgba8);
    EXPECT_EQ(chapter->GetUnitType(), Kernel::UnitValue::UnitType::Points);
    EXPECT_FALSE(chapter->HasBleed() || chapter->IsFacingPages() || chapter->IsVerticalStack());
    EXPECT_FALSE(chapter->ContainsIndex());
    m_Book->RemoveChapters({At(0)});
    EXPECT_EQ(m_Book->IndexFromChapter(chapter), 0);
    EXPECT_TRUE(chapter->IsContinueFromPrevious()) << "there is no page number that it could have had";
}
