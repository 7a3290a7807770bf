#include "app/Console.h"

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
