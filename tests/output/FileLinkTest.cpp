#include "output/FileLink.h"

#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <fstream>

namespace Book
{
namespace
{

TEST(FileLinkTest, WebAddressesGetAProtocolAndLoseOneBackslash)
{
    struct Row
    {
        char const * path;
        char const * address;
    };
    for (Row const & row : {Row{"example.org/a", "https://example.org/a"}, Row{"http://example.org", "http://example.org"},
                            Row{"example.org\\", "https://example.org"}, Row{"example.org\\\\", "https://example.org\\"}}) {
        EXPECT_EQ(WebAddress(row.path), row.address);
    }
}

TEST(FileLinkTest, OnlySmallLettersMakeAPdf)
{
    EXPECT_TRUE(IsPdfPath("/a.b/c.pdf"));
    EXPECT_FALSE(IsPdfPath("/a/c.PDF"));
    EXPECT_FALSE(IsPdfPath("/a.pdf/c"));
}

TEST(FileLinkTest, AnIncludedFileIsCopiedOnceAndLinkedByName)
{
    TemporaryFolder const source;
    TemporaryFolder const target;
    std::ofstream((source / "data.txt").c_str()) << "new";
    std::ofstream((source / "plain").c_str()) << "plain";

    String relative;
    EXPECT_TRUE(CopyBeside((source / "plain"), (target / "book.pdf"), relative));
    EXPECT_EQ(relative, "plain");
    EXPECT_TRUE(CopyBeside((source / "data.txt"), (target / "book.pdf"), relative));
    EXPECT_EQ(relative, "data.txt");

    std::ofstream((target / "data.txt").c_str()) << "there already";
    EXPECT_TRUE(CopyBeside((source / "data.txt"), (target / "book.pdf"), relative));
    std::ifstream kept((target / "data.txt").c_str());
    std::string text;
    std::getline(kept, text);
    EXPECT_EQ(text, "there already");

    EXPECT_FALSE(CopyBeside((source / "missing.txt"), (target / "book.pdf"), relative));
}

}
}
