#pragma once

#include "framework/kernel/OutSerialiser.h"
#include "framework/kernel/OutStream.h"

namespace Kernel
{

/// Writes a whole tagged stream: gathers it in memory and hands it on with `Close`.
class OutSerialiserFile : public OutSerialiser
{
public:
    /// `rootTag` and `version` are those of the content as a whole. Stream and store must outlive the object.
    OutSerialiserFile(OutStream & stream, FileStoreOut & store, IDTag rootTag, unsigned short version);

    /// Writes the stream out, once. Without it nothing is written. In a run that only collects paths it writes nothing.
    void Close();

private:
    OutStream & m_Stream;
    IDTag const m_RootTag;
    unsigned short const m_Version;
    bool m_Closed = false;
};

/// Writes an object's fields to memory, for comparing and hashing its value.
class OutSerialiserMemory : public OutSerialiser
{
public:
    /// `context` may be null.
    OutSerialiserMemory(FileStoreOut & store, CompareContext const * context);

    /// The object with its class and its fields.
    [[nodiscard]] std::vector<std::uint8_t> const & WriteWhole(Serialisable const & object);
};

}
