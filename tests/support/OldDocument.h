#pragma once

#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <fstream>
#include <iterator>

/// Copies one of the documents of tests/data, written in format 1, into the folder, and gives its path.
inline String WriteOldDocument(TemporaryFolder const & folder, std::string_view name,
                               std::string const & kept = "version-1.kvdoc")
{
    std::ifstream source(KORVANE_SOURCE_FOLDER "/tests/data/" + kept, std::ios::binary);
    EXPECT_TRUE(source.is_open());
    return folder.WriteFile(name, std::string(std::istreambuf_iterator<char>(source), {}));
}
