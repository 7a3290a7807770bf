#pragma once

#include "framework/kernel/InSerialiser.h"

#include <functional>
#include <memory>

namespace Kernel
{

/// The reader of a whole tagged stream, at the level of its root. It holds the stream's content in memory.
class InSerialiserFile : public virtual Countable, public InSerialiser
{
public:
    /// Reads the rest of the stream and checks it. Null if it does not begin like a tagged stream, or if `progress`
    /// says stop. Throws `ArchiveCorruptionException` for one that contradicts itself, and `FutureVersionException` for
    /// a class version that is newer than the program's, or a newer format of the stream as such.
    ///
    /// `progress`, which may be empty, gets the part done between 0 and 1 and returns false to stop. `unknownClass`,
    /// which may be empty, is told the uid of each object whose class nobody has registered. `store` must outlive the
    /// reader.
    [[nodiscard]] static Counted<InSerialiserFile> ParseWithChecks(InStream & stream, FileStore & store,
                                                                   DelayLoadsBehaviour delayLoads,
                                                                   std::function<bool(float)> progress,
                                                                   std::function<void(ClassUID)> unknownClass);
    ~InSerialiserFile() override;

    [[nodiscard]] IDTag GetRootTag() const { return m_RootTag; }
    [[nodiscard]] unsigned short GetVersion() const { return m_Version; }

private:
    InSerialiserFile(std::unique_ptr<Context> context, std::span<std::uint8_t const> fields, IDTag rootTag,
                     unsigned short version);

    std::unique_ptr<Context> m_OwnContext;
    IDTag const m_RootTag;
    unsigned short const m_Version;
};

}
