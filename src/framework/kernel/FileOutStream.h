#pragma once

#include "framework/kernel/File.h"
#include "framework/kernel/FileIOException.h"
#include "framework/kernel/FileStreamErrorHandler.h"
#include "framework/kernel/InStream.h"
#include "framework/kernel/OutStream.h"
#include "framework/kernel/ReplacementFile.h"

#include <memory>
#include <optional>
#include <vector>

namespace Kernel
{

/// Told how far a copy has come, and may stop it.
class StreamCopyProgress
{
public:
    virtual ~StreamCopyProgress() = default;
    /// `done` and `total` in bytes. False stops the copy.
    virtual bool OnProgress(std::uint64_t done, std::uint64_t total) = 0;
};

/// Writes a file. What `Create` makes is written beside its target and takes the target's place on `Close`, so that the
/// target is whole or untouched at every moment; a stream that goes without `Close` leaves nothing.
///
/// A failure throws `FileIOException`; with an error handler it is told to the handler and recorded, and the stream
/// then swallows what follows.
class FileOutStream : public OutStream
{
public:
    /// Null if the target cannot be made, with the reason in `result`, and a sentence in `*message` if that is not
    /// null. The folder must exist. A target that is no regular file, such as a pipe, is written to directly.
    [[nodiscard]] static Counted<FileOutStream> Create(char const * path, File::ShareMode share,
                                                       File::OpenUnmanagedResult & result, String * message);
    /// Writes to a file that is open already, in place. It is left where it is on `Close`; with `deleteOnRelease` it is
    /// removed when the stream goes.
    [[nodiscard]] static Counted<FileOutStream> CreateInPlace(std::unique_ptr<File> file, bool deleteOnRelease);

    ~FileOutStream() override;

    /// Null takes the handler out. It must outlive the stream or be taken out before.
    void SetErrorHandler(FileStreamErrorHandler * handler) { m_Handler = handler; }

    void Write(void const * data, std::size_t size) override;
    [[nodiscard]] std::uint64_t GetPosition() const override { return m_Position; }
    /// Copies the rest of the source. False if `progress`, which may be null, stopped it.
    bool CopyFromStream(InStream & source, StreamCopyProgress * progress);

    /// Writes out what is gathered, flushes file and folder to the disk and puts the file in the target's place. Once;
    /// a second call does nothing. False if this or an earlier write failed, and nothing has reached the target then.
    bool Close();
    /// An operation has failed.
    [[nodiscard]] bool HasError() const { return m_Error.has_value(); }
    [[nodiscard]] std::optional<FileIOException> const & GetError() const { return m_Error; }
    /// The path that was asked for.
    [[nodiscard]] String const & GetPath() const { return m_Path; }

private:
    FileOutStream() = default;

    template <typename TWork>
    void Guarded(TWork const & work);
    void WriteOut();

    String m_Path;
    std::unique_ptr<ReplacementFile> m_Replacement;
    std::unique_ptr<File> m_InPlace;
    bool m_DeleteOnRelease = false;
    bool m_Closed = false;
    std::vector<std::uint8_t> m_Gathered;
    std::uint64_t m_Position = 0;
    FileStreamErrorHandler * m_Handler = nullptr;
    std::optional<FileIOException> m_Error;
};

}
