#include "framework/kernel/StringT.h"

#include <gtest/gtest.h>

TEST(StringTTest, AnEmptyStringAndADefaultOneAreTheSameText)
{
    String const empty("");
    String const byDefault;
    EXPECT_EQ(empty, byDefault);
    EXPECT_EQ(empty.Data(), byDefault.Data());
    EXPECT_EQ(String(static_cast<char const *>(nullptr)).Data(), byDefault.Data());
}

TEST(StringTTest, AppendingToASharedStringLeavesTheOtherHolderAlone)
{
    String a("page");
    String const b = a;
    a.Append(" number");
    EXPECT_EQ(a, "page number");
    EXPECT_EQ(b, "page");
    a.Append(a.View());
    EXPECT_EQ(a, "page numberpage number");
}

TEST(StringTTest, OrderIsThatOfBytesAndLengthCountsZeroBytes)
{
    EXPECT_LT(Kernel::BaseCharTraits<char>::Compare("Zebra", "apple"), 0);
    EXPECT_LT(Kernel::BaseCharTraits<char>::Compare("z", "\xC3\xA9"), 0);
    EXPECT_EQ(String("a\0b", 3).Length(), 3u);
}
