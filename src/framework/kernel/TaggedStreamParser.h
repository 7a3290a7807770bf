#pragma once

#include "framework/kernel/InSerialiserFile.h"
#include "framework/kernel/TaggedStreamFormat.h"

#include <cstdint>
#include <functional>
#include <span>
#include <vector>

namespace Kernel
{

/// Walks a whole tagged stream once and checks all that the readers later rely on: every length lies within what holds
/// it, fixed-size fields have their size, arrays hold whole elements, strings fill their array, objects nest to a
/// bounded depth, each shared value is defined once before it is referred to. Nothing is allocated but the table of
/// shared values. Throws `ArchiveCorruptionException` or `FutureVersionException`.
class TaggedStreamParser
{
public:
    TaggedStreamParser(std::span<std::uint8_t const> whole, String sourceName, bool checkVersions,
                       std::function<bool(float)> const & progress, std::function<void(ClassUID)> const & unknownClass);

    /// False if `progress` said stop.
    bool ParseFields(std::span<std::uint8_t const> fields);

    /// The objects of the shared values, by their numbers.
    [[nodiscard]] std::vector<std::span<std::uint8_t const>> & GetShared() { return m_Shared; }

private:
    using Bytes = std::span<std::uint8_t const>;

    [[noreturn]] void Fail(std::uint8_t const * at, String const & fault) const;
    void ParseFieldsWithin(Bytes fields, int depth);
    void ParsePayload(PropType type, Bytes payload, int depth);
    void ParseObject(Bytes payload, int depth);
    void ParseObjectArray(Bytes payload, int depth);
    void ParseSharedObject(Bytes payload, int depth);
    void ParseStringArray(Bytes payload) const;
    /// Takes one field with its padding off the front of `fields`.
    Bytes TakeField(Bytes & fields, PropType & type) const;

    Bytes const m_Whole;
    String const m_SourceName;
    bool const m_CheckVersions;
    std::function<bool(float)> const & m_Progress;
    std::function<void(ClassUID)> const & m_UnknownClass;
    std::vector<Bytes> m_Shared;
};

}
