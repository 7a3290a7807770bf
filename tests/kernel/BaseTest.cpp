#include "framework/kernel/Clock.h"
#include "framework/kernel/ContentHash.h"
#include "framework/kernel/Dispatch.h"
#include "framework/kernel/Entropy.h"
#include "framework/kernel/HashAccumulator.h"
#include "framework/kernel/Semaphore.h"
#include "framework/kernel/Trace.h"
#include "framework/kernel/UnitValueConverter.h"
#include "framework/kernel/Uuid.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <atomic>
#include <optional>
#include <thread>

using namespace Kernel;

TEST(SemaphoreTest, AWaiterMayDestroyItAsSoonAsItHasBeenWoken)
{
    // Under the address and thread sanitizers a signal that touches the semaphore too late shows here.
    for (int round = 0; round < 2000; ++round) {
        std::optional<Semaphore> semaphore(std::in_place, 0);
        std::thread signaller([&semaphore] { semaphore->Signal(); });
        EXPECT_TRUE(semaphore->Wait(0));
        semaphore.reset();
        signaller.join();
    }
}

TEST(SemaphoreTest, AWaitTakesOneFromTheCountOrEndsInTime)
{
    Semaphore semaphore(2);
    EXPECT_TRUE(semaphore.Wait(1) && semaphore.Wait(0));
    EXPECT_FALSE(semaphore.Wait(1));
    semaphore.Signal();
    EXPECT_TRUE(semaphore.Wait(1));
}

TEST(DispatchTest, EveryIndexRunsOnceAlsoWhenDispatchesNest)
{
    std::vector<std::atomic<int>> runs(300);
    Dispatch::ParallelFor(30, [&runs](unsigned long long outer) {
        Dispatch::ParallelFor(10, [&runs, outer](unsigned long long inner) { ++runs[outer * 10 + inner]; });
    });
    for (auto const & count : runs) {
        EXPECT_EQ(1, count.load());
    }
}

TEST(DispatchTest, AnExceptionStopsTheRestAndReachesTheCaller)
{
    std::atomic<int> runs{0};
    EXPECT_THROW(Dispatch::ParallelFor(100'000,
                                       [&runs](unsigned long long index) {
                                           ++runs;
                                           if (index == 5) {
                                               throw std::runtime_error("five");
                                           }
                                       }),
                 std::runtime_error);
    EXPECT_LT(runs.load(), 100'000);
}

TEST(UuidTest, IdsAreNewEachTimeUnlessTheSequenceIsFixed)
{
    String const id = Uuid().ToString();
    ASSERT_EQ(36u, id.Length());
    EXPECT_EQ('4', id.Data()[14]);
    EXPECT_NE(std::string::npos, std::string("89ab").find(id.Data()[19]));
    EXPECT_NE(id, Uuid().ToString());

    std::vector<String> first;
    std::vector<String> second;
    for (std::vector<String> * ids : {&first, &second}) {
        Entropy::FixSequence(7);
        *ids = {Uuid().ToString(), Uuid().ToString()};
    }
    Entropy::ReleaseSequence();
    EXPECT_EQ(first, second);
    EXPECT_NE(first[0], first[1]);
}

TEST(HashTest, DependsOnValuesAndTheirBoundsNotOnTheCuts)
{
    auto const hash = [](auto... values) {
        HashAccumulator accumulator;
        (accumulator.Add(values), ...);
        return accumulator.Get128();
    };
    EXPECT_NE(hash(String("ab"), String("c")), hash(String("a"), String("bc")));
    EXPECT_NE(hash(1, 2), hash(2, 1));
    EXPECT_EQ(hash(1, 2.5, String("x")), hash(1, 2.5, String("x")));
    HashAccumulator cut;
    cut.AddBytes("abc", 3);
    cut.AddBytes("def", 3);
    EXPECT_EQ(HashBytes128("abcdef", 6), cut.Get128());
    EXPECT_EQ(32u, cut.Get128().ToString().Length());
}

TEST(HashTest, AContentHashIsSha256)
{
    TemporaryFolder const folder;
    char const * const expected =
        "ba7816bf8f01cfea414140de5dae2223b00361a396177a9cb410ff61f20015ad"; // FIPS 180-4: "abc"
    EXPECT_EQ(expected, ContentHash::OfBytes("abc", 3).ToString());
    ContentHash ofFile;
    EXPECT_TRUE(ContentHash::OfFile(folder.WriteFile("font", "abc"), ofFile));
    EXPECT_EQ(expected, ofFile.ToString());
    ContentHash parsed;
    EXPECT_TRUE(ContentHash::FromString(expected, parsed));
    EXPECT_EQ(ofFile, parsed);
    EXPECT_FALSE(ContentHash::FromString("ba78", parsed) || ContentHash::OfFile(folder / "none", parsed));
    EXPECT_EQ(ofFile, parsed) << "left as it was";
}

TEST(ClockTest, AHeldClockStandsUntilItIsMoved)
{
    ManualClock clock(TimeStamp(1000));
    Clock::Set(&clock);
    EXPECT_EQ(TimeStamp(1000), Clock::Get().Now());
    auto const start = Clock::Get().Steady();
    clock.Advance(std::chrono::nanoseconds(5));
    EXPECT_EQ(TimeStamp(1005), Clock::Get().Now());
    EXPECT_EQ(std::chrono::nanoseconds(5), Clock::Get().Steady() - start);
    Clock::Set(nullptr);
    EXPECT_LT(TimeStamp(1'000'000'000'000'000'000), Clock::Get().Now());
}

TEST(TraceTest, LinesGoToWhoeverListens)
{
    std::vector<String> lines;
    SetTraceTarget([&lines](String const & line) { lines.push_back(line); });
    Trace("*** Locked ***");
    Trace(String("LoadChapter:a\n"));
    SetTraceTarget(nullptr);
    Trace("nobody listens");
    EXPECT_EQ((std::vector<String>{"*** Locked ***", "LoadChapter:a\n"}), lines);
}

TEST(UnitValueConverterTest, UnitsRelateToThePoint)
{
    UnitValueConverter const converter(144.0);
    std::pair<UnitValue::UnitType, double> const inches[] = {
        {UnitValue::UnitType::Points, 72.0},      {UnitValue::UnitType::Picas, 6.0},
        {UnitValue::UnitType::Inches, 1.0},       {UnitValue::UnitType::Millimetres, 25.4},
        {UnitValue::UnitType::Centimetres, 2.54}, {UnitValue::UnitType::Pixels, 144.0},
    };
    for (auto const & [unit, oneInch] : inches) {
        EXPECT_DOUBLE_EQ(72.0, converter.ToPoints(oneInch, unit));
        EXPECT_DOUBLE_EQ(oneInch, converter.FromPoints(72.0, unit));
    }
}
