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
    };

    Context(Counted<RawData const> buffer, FileStore & store, String sourceName)
        : m_Buffer(std::move(buffer)), m_Store(store), m_SourceName(std::move(sourceName))
    {
    }

    /// Place of a byte of the buffer, for messages.
    [[nodiscard]] String PlaceOf(std::uint8_t const * at) const;

    Counted<RawData const> const m_Buffer;
    FileStore & m_Store;
    String const m_SourceName;
    std::vector<Shared> m_Shared;
    /// Objects that are being made at this moment, each for the next. References between shared values can chain more of
    /// them than lie in each other.
    int m_Depth = 0;
};

}
