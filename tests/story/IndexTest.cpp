#include "framework/story/ByteStream.h"
#include "framework/story/Index.h"

#include <gtest/gtest.h>

#include <thread>

namespace
{

using namespace Story;
using Kernel::Counted;
using Kernel::MakeCounted;

String Path(std::initializer_list<char const *> names)
{
    std::string path;
    for (auto const * name : names) {
        path += (path.empty() ? "" : std::string(1, IndexTopic::NameSeparator)) + name;
    }
    return path;
}

TEST(IndexTest, TopicsAreFoundByGUIDAndByFullName)
{
    Index index;
    auto const leaf = index.EnsureTopic(Path({"Animals", "Dogs", "Terriers"}));
    EXPECT_EQ(index.GetTopicCount(), 3u);
    EXPECT_EQ(index.EnsureTopic(Path({"Animals", "Dogs", "Terriers"})), leaf);
    EXPECT_EQ(leaf->GetNameWithParents(), Path({"Animals", "Dogs", "Terriers"}));
    EXPECT_FALSE(index.FindTopicByName("Terriers", false));
    EXPECT_FALSE(index.FindTopicByName(Path({"animals", "dogs"}), false));
    EXPECT_TRUE(index.FindTopicByName(Path({"animals", "dogs"}), true));
    EXPECT_FALSE(index.FindTopicByGUID("")) << "topics without a GUID are not found by an empty one";

    leaf->SetGUID("g1");
    EXPECT_EQ(index.FindTopicByGUID("g1"), leaf);
    leaf->SetGUID("g2");
    EXPECT_FALSE(index.FindTopicByGUID("g1")) << "a look-up after a change sees the change";
    index.GetMutableTopic(leaf->GetParent())->SetName("Hounds");
    EXPECT_TRUE(index.IsNameUsed(Path({"Animals", "Hounds", "Terriers"})));

    auto twin = MakeCounted<IndexTopic>();
    twin->SetGUID("g2");
    EXPECT_FALSE(index.AddTopic(twin)) << "the GUID is taken";
    EXPECT_FALSE(index.AddTopic(leaf));
}

TEST(IndexTest, AWalkKeepsTheListThatItBeganWith)
{
    Index index;
    index.EnsureTopic("a");
    index.EnsureTopic("b");
    int count = 0;
    for (auto const & topic : index) {
        index.EnsureTopic(topic->GetName() + "x");
        index.RemoveTopics({topic});
        ++count;
    }
    EXPECT_EQ(count, 2);
    EXPECT_TRUE(index.IsNameUsed("ax") && index.IsNameUsed("bx"));
    EXPECT_EQ(index.GetTopicCount(), 2u);
}

TEST(IndexTopicTest, RefusesRings)
{
    auto const a = MakeCounted<IndexTopic>();
    auto const b = MakeCounted<IndexTopic>();
    b->SetParent(a);
    a->SetParent(b);
    a->SetParent(a);
    EXPECT_FALSE(a->GetParent());
    EXPECT_FALSE(a->AddCrossReference(a));
    EXPECT_TRUE(a->AddCrossReference(b));
    EXPECT_FALSE(a->AddCrossReference(b));
    EXPECT_TRUE(a->IsDirectlyRelatedTo(b));
    EXPECT_FALSE(b->IsDirectlyRelatedTo(a));
    EXPECT_TRUE(a->RemoveCrossReference(b));
    EXPECT_FALSE(a->RemoveCrossReference(b));
}

TEST(IndexTest, RemovingATopicLiftsWhatIsBelowAndUntiesReferencesAndContentBringsItBack)
{
    Index index;
    auto const leaf = index.EnsureTopic(Path({"Top", "Middle", "Leaf"}));
    auto const middle = index.GetMutableTopic(leaf->GetParent());
    auto const top = index.GetMutableTopic(middle->GetParent());
    auto const other = index.EnsureTopic("Other");
    other->AddCrossReference(middle);
    middle->AddCrossReference(other);
    auto const before = index.GetContent();

    index.RemoveTopics({middle});
    EXPECT_EQ(leaf->GetParent(), top);
    EXPECT_FALSE(other->IsDirectlyRelatedTo(middle));
    EXPECT_FALSE(index.GetMutableTopic(middle));

    top->SetParent(leaf);
    top->SetName("Changed");
    leaf->SetParent(nullptr);
    index.SetContent(before);
    EXPECT_EQ(leaf->GetNameWithParents(), Path({"Top", "Middle", "Leaf"}));
    EXPECT_TRUE(other->IsDirectlyRelatedTo(middle));
    EXPECT_TRUE(index.GetMutableTopic(middle));
}

TEST(IndexTest, ACloneIsDeepAndHasGUIDsEverywhere)
{
    Counted<Index> clone;
    {
        Index index;
        auto const leaf = index.EnsureTopic(Path({"Top", "Leaf"}));
        leaf->SetGUID("kept");
        leaf->SetSortString("sorted");
        auto const top = index.GetMutableTopic(leaf->GetParent());
        leaf->AddCrossReference(top);
        top->AddCrossReference(leaf);
        EXPECT_TRUE(index.TopicsContainGUIDs());
        clone = index.CloneAddingGUIDS();
        EXPECT_FALSE(top->HasGUID()) << "the original stays as it is";
    }
    for (auto const & topic : *clone) {
        EXPECT_TRUE(topic->HasGUID());
    }
    auto const leaf = clone->FindTopicByGUID("kept");
    ASSERT_TRUE(leaf);
    EXPECT_EQ(leaf->GetNameWithParents(), Path({"Top", "Leaf"}));
    EXPECT_EQ(leaf->GetSortString(), "sorted");
    EXPECT_TRUE(leaf->IsDirectlyRelatedTo(leaf->GetParent()));
    EXPECT_TRUE(leaf->GetParent()->IsDirectlyRelatedTo(leaf));
}

TEST(IndexTest, ComesBackFromBytesAndRefusesDamage)
{
    Index index;
    auto const leaf = index.EnsureTopic(Path({"Top", "Leaf"}));
    leaf->SetGUID("g");
    leaf->AddCrossReference(leaf->GetParent());
    ByteWriter out;
    index.SaveBytes(out);
    Index loaded;
    ByteReader in(out.GetBytes());
    ASSERT_TRUE(loaded.LoadBytes(in));
    auto const found = loaded.FindTopicByGUID("g");
    ASSERT_TRUE(found);
    EXPECT_TRUE(found->IsDirectlyRelatedTo(found->GetParent()));
    for (std::size_t size = 0; size < out.GetBytes().size(); ++size) {
        ByteReader part(std::span(out.GetBytes()).first(size));
        Index target;
        EXPECT_FALSE(target.LoadBytes(part)) << size;
    }
}

TEST(IndexTest, MayBeReadWhileItChanges)
{
    Index index;
    std::atomic<bool> stop = false;
    std::thread reader([&] {
        while (!stop) {
            for (auto const & topic : index) {
                static_cast<void>(topic->GetNameWithParents());
            }
            static_cast<void>(index.FindTopicByName("n5", false));
        }
    });
    for (int i = 0; i < 500; ++i) {
        auto const topic = index.EnsureTopic(String("n" + std::to_string(i % 20)));
        topic->SetGUID(String(std::to_string(i)));
        if (i % 3 == 0) {
            index.RemoveTopics({topic});
        }
    }
    stop = true;
    reader.join();
    EXPECT_LE(index.GetTopicCount(), 20u);
}

}
