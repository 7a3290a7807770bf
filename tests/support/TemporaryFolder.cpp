#include "support/TemporaryFolder.h"

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <iterator>

TemporaryFolder::TemporaryFolder()
{
    std::string pattern = (std::filesystem::temp_directory_path() / "korvane-test-XXXXXX").string();
    if (!::mkdtemp(pattern.data())) {
        ADD_FAILURE() << "no temporary folder can be made at " << pattern;
    }
    m_Path = String(pattern);
}

TemporaryFolder::~TemporaryFolder()
{
    std::error_code ignored;
    std::filesystem::remove_all(m_Path.ToStd(), ignored);
}

String TemporaryFolder::operator/(std::string_view name) const
{
    return Kernel::ConcatString({m_Path, "/", name});
}

String TemporaryFolder::WriteFile(std::string_view name, std::string_view content) const
{
    String const path = *this / name;
    std::filesystem::create_directories(std::filesystem::path(path.ToStd()).parent_path());
    std::ofstream(path.ToStd(), std::ios::binary).write(content.data(), static_cast<std::streamsize>(content.size()));
    return path;
}

std::string TemporaryFolder::ReadFile(std::string_view name) const
{
    std::ifstream stream((*this / name).ToStd(), std::ios::binary);
    if (!stream) {
        ADD_FAILURE() << (*this / name) << " cannot be read";
    }
    return std::string(std::istreambuf_iterator<char>(stream), {});
}
