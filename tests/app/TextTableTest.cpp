#include "app/TextTable.h"

#include <gtest/gtest.h>

using App::CellLook;
using App::TextTable;

TEST(TextTableTest, WidthIsThatOfTheTerminalNotOfTheBytes)
{
    struct Case
    {
        char const * m_Why;
        std::string m_Text;
        int m_Width;
    };
    for (auto const & [why, text, width] : {
             Case{"nothing", "", 0},
             Case{"two bytes, one column", "Übung", 5},
             Case{"wide characters", "日本語", 6},
             Case{"a letter and a combining mark", "e\u0301a", 2},
             Case{"a joiner takes no room", "a\u200Db", 2},
             Case{"a pictogram is wide", "\U0001F4D6", 2},
             Case{"what is not UTF-8 still counts",
                  "a\xff"
                  "b",
                  3},
         }) {
        EXPECT_EQ(App::DisplayWidth(text), width) << why;
    }
}

TEST(TextTableTest, CuttingNeverSplitsACharacterAndNeverExceedsTheWidth)
{
    for (std::string const text : {"Anna", "日本語の章", "e\u0301e\u0301e\u0301e\u0301", "a日b本c", "x\xff\xfey"}) {
        for (int width = 0; width <= 12; ++width) {
            std::string const cut = App::CutToWidth(text, width);
            EXPECT_LE(App::DisplayWidth(cut), width) << text << ' ' << width;
            if (width < App::DisplayWidth(text) && 0 < width) {
                ASSERT_TRUE(cut.ends_with("\u2026")) << cut;
                EXPECT_TRUE(text.starts_with(cut.substr(0, cut.size() - 3))) << cut;
            } else if (0 < width) {
                EXPECT_EQ(cut, text);
            }
        }
    }
    EXPECT_EQ(App::CutToWidth("日本語", 4), "日\u2026") << "half a wide character is none";
    EXPECT_EQ(App::CutToWidth("e\u0301te\u0301", 2), "e\u0301\u2026") << "the mark stays with its letter";
}

namespace
{

TextTable MakeTable()
{
    TextTable table({{""}, {"No", false, true}, {"Chapter", true}, {"Unused"}, {"State"}, {"Document", true}});
    table.AddRow({{"\u2605"}, {"1"}, {"日本語"}, {""}, {"ok", CellLook::Good}, {"first.kvdoc"}});
    table.AddRow({{""}, {"12"}, {"The long way home"}, {""}, {"missing", CellLook::Bad}, {"b.kvdoc"}});
    return table;
}

}

TEST(TextTableTest, ColumnsLineUpAndEmptyOnesAreLeftOut)
{
    EXPECT_EQ(MakeTable().Layout(0, false), (std::vector<std::string>{
                                                "   No  Chapter            State    Document",
                                                "\u2605   1  日本語             ok       first.kvdoc",
                                                "   12  The long way home  missing  b.kvdoc",
                                            }));
    EXPECT_TRUE(TextTable({{"Title"}}).Layout(0, false).empty()) << "titles of nothing";
}

TEST(TextTableTest, ANarrowTerminalTakesFromTheLastFlexibleColumnFirst)
{
    EXPECT_EQ(MakeTable().Layout(43, false).back(), "   12  The long way home  missing  b.kvdoc");
    EXPECT_EQ(MakeTable().Layout(43, false)[1], "\u2605   1  日本語             ok       first.k\u2026");
    EXPECT_EQ(MakeTable().Layout(34, false).back(), "   12  The lon\u2026  missing  b.kvdoc");
    for (int columns = 1; columns < 60; ++columns) {
        for (std::string const & line : MakeTable().Layout(columns, false)) {
            EXPECT_LE(App::DisplayWidth(line), columns) << '"' << line << '"';
        }
    }
}

TEST(TextTableTest, ColoursWrapTheTextAloneAndControlCharactersNeverPass)
{
    auto const lines = MakeTable().Layout(0, true);
    EXPECT_NE(lines[2].find("\x1b[31mmissing\x1b[0m  b.kvdoc"), std::string::npos) << lines[2];
    TextTable table({{"Name"}});
    table.AddRow({{"a\x1b[2Jb\nc"}});
    EXPECT_EQ(table.Layout(0, false)[1], "a?[2Jb?c");
}
