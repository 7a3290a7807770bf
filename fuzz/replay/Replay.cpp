#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const * data, std::size_t size);

/// Feeds every file of the given folders to the fuzz target that it is linked with, so that first inputs and the
/// crashes found once are tried again in every build, without libFuzzer.
int main(int count, char ** arguments)
{
    int inputs = 0;
    for (int i = 1; i < count; ++i) {
        std::vector<std::filesystem::path> paths;
        for (auto const & entry : std::filesystem::directory_iterator(arguments[i])) {
            paths.push_back(entry.path());
        }
        std::sort(paths.begin(), paths.end());
        for (auto const & path : paths) {
            // Before the call: the last line tells which input it was that crashed.
            std::printf("%s\n", path.c_str());
            std::fflush(stdout);
            std::ifstream stream(path, std::ios::binary);
            std::string const content(std::istreambuf_iterator<char>(stream), {});
            LLVMFuzzerTestOneInput(reinterpret_cast<std::uint8_t const *>(content.data()), content.size());
            ++inputs;
        }
    }
    std::printf("%d inputs\n", inputs);
    return inputs == 0 ? 1 : 0;
}
