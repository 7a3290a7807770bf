#pragma once

#include "framework/kernel/FileOutStream.h"

namespace Kernel
{

/// Files in the folder for temporary files.
class TempFile
{
public:
    /// Makes a new file that only this user may read, with the extension (with or without a leading `.`; may be empty).
    /// Gives its path and a stream on it; null, and an empty path, if it cannot be made. The caller deletes the file;
    /// with `deleteOnRelease` it goes with the stream.
    [[nodiscard]] static Counted<FileOutStream> GenerateTempOutFile(String & path, String const & extension,
                                                                    bool deleteOnRelease);
};

}
