#pragma once

#include "framework/kernel/InSerialiser.h"

namespace Kernel
{

/// What all readers of one stream share. Only the readers use this.
struct InSerialiser::Context
{
    /// A shared value: where its object lies and, once somebody has asked for it, the object.
    struct Shared
    {
        std::span<std::uint8_t const> m_Payload;
        Consolidated<SharedSerialisable> m_Object;
        bool m_Loading = false;
        /// Levels of objects below and including this one.
        int m_Height = 0;
    };

    Context(Counted<RawData const> buffer, FileStore & store, String sourceName)
        : m_Buffer(std::move(buffer)),
          m_Store(store),
          m_SourceName(std::move(sourceName))
    {
    }

    /// Place of a byte of the buffer, for messages.
    [[nodiscard]] String PlaceOf(std::uint8_t const * at) const;
    /// Throws `ArchiveCorruptionException` if another level above so many would be too many.
    void CheckDepth(int levels, std::uint8_t const * at) const;

    Counted<RawData const> const m_Buffer;
    FileStore & m_Store;
    String const m_SourceName;
    std::vector<Shared> m_Shared;
    /// Objects that are being made at this moment, each for the next; and the levels below the one being made, those of
    /// shared values that were made before included. References between shared values can chain more objects than lie
    /// in each other, and what has been read must be writable again.
    int m_Depth = 0;
    int m_Height = 0;
};

}
