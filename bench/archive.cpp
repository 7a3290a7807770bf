#include "framework/kernel/Archive.h"
#include "framework/kernel/InSerialiserFile.h"
#include "framework/kernel/MemoryStreams.h"
#include "framework/kernel/OutSerialiserFile.h"

#include <benchmark/benchmark.h>

#include <string>
#include <vector>

using namespace Kernel;
using Level = FileStoreCompressionHintGeneral::CompressionLevel;

namespace
{

constexpr IDTag Type("KvBm");

/// A chapter's worth of fields: 100,000 UTF-16 units that compress like text, and 2,000 small fields.
Counted<RawData> MakeStream()
{
    CollectingFileStoreOut store(true);
    MemoryOutStream stream;
    OutSerialiserFile out(stream, store, "Root", 1);
    std::u16string text;
    for (unsigned seed = 1; text.size() < 100'000; seed = seed * 1664525 + 1013904223) {
        static constexpr char16_t const * Words[] = {u"chapter ", u"river ", u"the ", u"of ", u"morning, ", u"went ",
                                                     u"again. ",  u"house ", u"and ", u"a ",  u"stood ",    u"light "};
        text += Words[seed >> 20 & 7 ? seed >> 24 & 7 : 8 + (seed >> 24 & 3)];
    }
    out.SaveType("text", text);
    for (int i = 0; i < 2000; ++i) {
        out.SaveType(IDTag(0x61000000u + static_cast<std::uint32_t>(i)), i);
    }
    out.Close();
    return stream.RelinquishOwnership();
}

void Save(String const & path, Counted<RawData const> const & data, Level level)
{
    Archive::CreateResult result;
    auto const archive = Archive::CreateWithTemporary(path, Type, result);
    ArchiveSessionHandle session;
    archive->CreateSessionAdv(session, Archive::SessionType::Whole, nullptr, false);
    session->SaveBytes("doc.dat", FileStoreCompressionHintGeneral(level, CompressionPredictorType::None, 0), data);
    archive->CloseSession(session, false);
}

void OpenAndLoad(benchmark::State & state)
{
    String const path = FileSystem::GetTemporaryFolder() + "/korvane-bench.kvdoc";
    Save(path, MakeStream(), static_cast<Level>(state.range(0)));
    for (auto _ : state) {
        Archive::OpenResult result{};
        auto const archive = Archive::Open(path, Archive::OpenMode::Read, Type, result);
        benchmark::DoNotOptimize(archive->ReadItem("doc.dat"));
    }
    FileSystem::Delete(path, 0);
}
BENCHMARK(OpenAndLoad)->ArgName("level")->Arg(0)->Arg(1)->Unit(benchmark::kMicrosecond);

void OpenAlone(benchmark::State & state)
{
    String const path = FileSystem::GetTemporaryFolder() + "/korvane-bench.kvdoc";
    Save(path, MakeStream(), Level::Fast);
    for (auto _ : state) {
        Archive::OpenResult result{};
        benchmark::DoNotOptimize(Archive::Open(path, Archive::OpenMode::Read, Type, result));
    }
    FileSystem::Delete(path, 0);
}
BENCHMARK(OpenAlone)->Unit(benchmark::kMicrosecond);

void SaveReplacing(benchmark::State & state)
{
    String const path = FileSystem::GetTemporaryFolder() + "/korvane-bench.kvdoc";
    auto const data = MakeStream();
    for (auto _ : state) {
        // Another content each time: the same one would leave the file alone.
        ++*reinterpret_cast<std::uint32_t *>(data->GetMutableData() + 1000);
        Save(path, data, static_cast<Level>(state.range(0)));
    }
    FileSystem::Delete(path, 0);
}
BENCHMARK(SaveReplacing)->ArgName("level")->Arg(0)->Arg(1)->Unit(benchmark::kMicrosecond);

void ParseAndLoadFields(benchmark::State & state)
{
    auto const data = MakeStream();
    EmptyFileStore store;
    for (auto _ : state) {
        MemoryInStream stream(data, "bench");
        auto const in = InSerialiserFile::ParseWithChecks(stream, store, InSerialiser::DelayLoadsBehaviour::CheckAll,
                                                          nullptr, nullptr);
        std::span<char16_t const> text;
        in->LoadView("text", text);
        int value = 0;
        for (int i = 0; i < 2000; ++i) {
            in->LoadType(IDTag(0x61000000u + static_cast<std::uint32_t>(i)), value);
        }
        benchmark::DoNotOptimize(value);
    }
}
BENCHMARK(ParseAndLoadFields)->Unit(benchmark::kMicrosecond);

}

BENCHMARK_MAIN();
