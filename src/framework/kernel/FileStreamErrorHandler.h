#pragma once

namespace Kernel
{

class FileIOException;

/// Told of a file stream's failures, which are then recorded in the stream and not thrown. Runs on the thread that uses
/// the stream.
class FileStreamErrorHandler
{
public:
    virtual void OnReadError(FileIOException const &) {}
    virtual void OnWriteError(FileIOException const &) {}

    virtual ~FileStreamErrorHandler() = default;
};

}
