#pragma once

#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <fstream>
#include <iterator>

/// Copies a document that was written in format 1 into the folder, and gives its path.
inline String WriteOldDocument(TemporaryFolder const & folder, std::string_view name)
{
    std::ifstream source(KORVANE_SOURCE_FOLDER "/tests/data/version-1.kvdoc", std::ios::binary);
    EXPECT_TRUE(source.is_open());
    return folder.WriteFile(name, std::string(std::istreambuf_iterator<char>(source), {}));
}
