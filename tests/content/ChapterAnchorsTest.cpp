#include "content/ReconcileAnchorsCommand.h"
#include "core/BookCollection.h"
#include "framework/document/AnchorInfo.h"
#include "framework/document/Anchors.h"
#include "framework/document/DocumentController.h"
#include "framework/document/PDFBookmarkManager.h"
#include "framework/kernel/FileSystem.h"
#include "framework/story/AnchorData.h"
#include "support/BookBuilder.h"

#include <gtest/gtest.h>

namespace Book
{
namespace
{

class ChapterAnchorsTest : public testing::Test
{
protected:
    void SetUp() override
    {
        m_Book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc", {.m_Anchors = {"one", "two"}}),
                                    m_Builder.WriteChapter("b.kvdoc", {.m_Anchors = {"three"}})});
        // Anchors get their identity when the book first reconciles the chapter.
        for (int index : {0, 1}) {
            Kernel::Counted<BookChapter> const chapter = m_Book->GetChapterAtIndex(index);
            ASSERT_TRUE(m_Book->LoadChapterDocument(chapter, true, false));
            m_Book->ReleaseChapterDocument(chapter, true);
        }
        BookBuilder::Rest();
    }

    Snapshot<std::vector<AnchorInfo>> Anchors(int chapter) { return m_Book->GetChapterAtIndex(chapter)->GetAnchors(); }

    BookBuilder m_Builder;
    Kernel::Counted<BookController> m_Book;
};

TEST_F(ChapterAnchorsTest, RecordsKnowTheAnchorsOfClosedChapters)
{
    auto const first = Anchors(0);
    ASSERT_EQ(first.size(), 2u);
    EXPECT_EQ(first[0].m_Name, "one");
    EXPECT_EQ(first[0].m_ChapterName, "a");
    EXPECT_FALSE(first[0].m_Uid.Empty());
    EXPECT_NE(first[0].m_Uid, first[1].m_Uid);
    EXPECT_EQ(first[0].m_SpreadIndex, 0);
    EXPECT_GT(first[0].m_TargetPoint.y, 0) << "a place on the page";

    String const uid = Anchors(1)[0].m_Uid;
    AnchorInfo const * const found = m_Book->GetAnchorInfo(uid);
    ASSERT_NE(found, nullptr);
    EXPECT_EQ(found->m_ChapterIndex, 1);
    EXPECT_EQ(m_Book->GetChapterContainingAnchor(uid), m_Book->GetChapterAtIndex(1));
    EXPECT_EQ(m_Book->GetAnchorInfo("nobody's"), nullptr);
    EXPECT_FALSE(m_Book->IsInReconcileAnchors());
}

TEST_F(ChapterAnchorsTest, OpeningAChapterAgainDoesNotChangeIt)
{
    String const path = m_Book->GetChapterAtIndex(0)->GetPath();
    Kernel::TimeStamp before;
    Kernel::TimeStamp after;
    ASSERT_TRUE(Kernel::FileSystem::GetModifiedTime(path, before));
    ASSERT_TRUE(m_Book->LoadChapterDocument(m_Book->GetChapterAtIndex(0), true, false));
    m_Book->ReleaseChapterDocument(m_Book->GetChapterAtIndex(0), false);
    BookBuilder::Rest();
    ASSERT_TRUE(Kernel::FileSystem::GetModifiedTime(path, after));
    EXPECT_EQ(before, after);
}

TEST_F(ChapterAnchorsTest, AStaleCacheIsFilledWhenSomebodyAsks)
{
    String const uid = Anchors(1)[0].m_Uid;
    m_Book->GetChapterAtIndex(1)->SetAnchorsDirty();
    EXPECT_TRUE(Anchors(1).empty());
    static_cast<void>(m_Book->GetAnchorInfo(uid));
    BookBuilder::Rest();
    ASSERT_NE(m_Book->GetAnchorInfo(uid), nullptr);
    EXPECT_FALSE(m_Book->GetChapterAtIndex(1)->AreAnchorsDirty());
}

TEST_F(ChapterAnchorsTest, OtherChaptersAnchorsComeAsBlindOnes)
{
    auto const list = Kernel::MakeCounted<::Anchors>();
    m_Book->AddBlindAnchors(list, m_Book->GetChapterAtIndex(0), nullptr);
    ASSERT_EQ(list->size(), 1);
    Kernel::Counted<AnchorInstance const> const blind = *list->begin();
    EXPECT_TRUE(blind->IsBlind());
    EXPECT_EQ(blind->GetName(), "three");
    EXPECT_EQ(blind->GetChapterIndex(), 1);
}

TEST_F(ChapterAnchorsTest, ThePointOfAnAnchorCountsWithinItsSpreadOnly)
{
    Kernel::Counted<DocumentController> const document =
        m_Book->LoadChapterDocument(m_Book->GetChapterAtIndex(1), true, false);
    Kernel::Counted<BookChapter> const chapter = m_Book->GetChapterAtIndex(0);
    BookBuilder::Rest();
    AnchorInfo info = Anchors(0)[0];
    auto const instance = Kernel::MakeCounted<AnchorInstance>(
        Kernel::MakeCounted<Story::AnchorData>(info.m_Name, false, false, info.m_Uid), 0);
    Kernel::Rect const extents = (*chapter->GetSpreadInfo())[0].m_SpreadExtents;

    struct Row
    {
        char const * why;
        int spread;
        Kernel::Point point;
        bool valid;
    };
    for (Row const & row : {Row{"inside", 0, {extents.left + 1, extents.top + 1}, true},
                            Row{"left and top belong to it", 0, {extents.left, extents.top}, true},
                            Row{"the right edge does not", 0, {extents.right, extents.top + 1}, false},
                            Row{"nor the bottom", 0, {extents.left + 1, extents.bottom}, false},
                            Row{"the cache is older than the spreads", 99, {extents.left + 1, extents.top + 1}, false}}) {
        info.m_SpreadIndex = row.spread;
        info.m_TargetPoint = row.point;
        chapter->SetAnchors({info});
        EXPECT_EQ(BookCollection::GetInstance().IsAnchorPointValid(instance, document), row.valid) << row.why;
    }
    EXPECT_TRUE(BookCollection::GetInstance().IsAnchorAbove(info.m_Uid, document));
    EXPECT_TRUE(BookCollection::GetInstance().IsAnchorAbove("nobody's", document)) << "what nobody has counts as above";
    m_Book->ReleaseChapterDocument(m_Book->GetChapterAtIndex(1), false);
}

}
}
