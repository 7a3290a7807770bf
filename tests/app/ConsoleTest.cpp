#include "app/Console.h"
#include "app/TextTable.h"

#include <gtest/gtest.h>

#include <sstream>

TEST(ConsoleTest, NoBarIsDrawnOverAQuestion)
{
    std::ostringstream out;
    std::ostringstream err;
    App::Console console(out, err, {}, {.m_HasProgress = true});
    console.Progress("Importing", 0.25);
    {
        App::Console::Pause const pause(console);
        std::string const before = err.str();
        EXPECT_TRUE(before.ends_with("\r\x1b[K")) << "the bar made room";
        console.Progress("Importing", 0.5);
        EXPECT_EQ(err.str(), before);
    }
    console.Progress("Importing", 0.75);
    EXPECT_NE(err.str().find("75%"), std::string::npos) << "it goes on afterwards";
}

TEST(ConsoleTest, ABarKeepsToItsLine)
{
    for (int const columns : {8, 20, 30, 80}) {
        for (std::string const step : {"Export", "Kapitel werden eingelesen"}) {
            std::ostringstream out;
            std::ostringstream err;
            App::Console console(out, err, {}, {.m_HasProgress = true, .m_ProgressColumns = columns});
            console.Progress(step, 1);
            std::string const bar = err.str().substr(std::string_view("\r\x1b[K").size());
            EXPECT_LT(App::DisplayWidth(bar), columns) << bar;
            EXPECT_TRUE(bar.ends_with(" 100%") || bar.ends_with("] 100%")) << bar;
        }
    }
}
