#pragma once

#include "framework/kernel/StringT.h"
#include "framework/story/Colour.h"

#include <cstdint>
#include <variant>
#include <vector>

namespace Kernel
{
class HashAccumulator;
}

namespace Story
{

class ByteReader;
class ByteWriter;

/// A handful of attributes by key: what a style or a piece of text sets, and nothing of what it leaves alone.
///
/// A key is an enumerator of `GlyphAtt` or `ParagraphAtt`; those two never share a set. Entries are kept sorted, so
/// that equal sets have equal entries. A value type; the objects that share sets (`GlyphAtts`, `ParagraphAtts`,
/// styles) never change them once they are published.
class AttSet
{
public:
    using Value = std::variant<std::int32_t, double, String, Colour>;
    struct Entry
    {
        std::uint16_t m_Key = 0;
        Value m_Value;
        friend bool operator==(Entry const &, Entry const &) = default;
    };

    /// Keys of the four value types lie apart: the type is in the key's upper bits.
    static constexpr std::uint16_t IntKey(int id) { return static_cast<std::uint16_t>(id); }
    static constexpr std::uint16_t DoubleKey(int id) { return static_cast<std::uint16_t>(0x4000 | id); }
    static constexpr std::uint16_t StringKey(int id) { return static_cast<std::uint16_t>(0x8000 | id); }
    static constexpr std::uint16_t ColourKey(int id) { return static_cast<std::uint16_t>(0xC000 | id); }

    void SetInt(int id, std::int32_t value) { Set(IntKey(id), value); }
    void SetDouble(int id, double value) { Set(DoubleKey(id), value); }
    void SetString(int id, String value) { Set(StringKey(id), std::move(value)); }
    void SetColour(int id, Colour value) { Set(ColourKey(id), value); }
    void Remove(std::uint16_t key);

    /// The value, or null if the set leaves the attribute alone.
    [[nodiscard]] std::int32_t const * FindInt(int id) const { return std::get_if<std::int32_t>(Find(IntKey(id))); }
    [[nodiscard]] double const * FindDouble(int id) const { return std::get_if<double>(Find(DoubleKey(id))); }
    [[nodiscard]] String const * FindString(int id) const { return std::get_if<String>(Find(StringKey(id))); }
    [[nodiscard]] Colour const * FindColour(int id) const { return std::get_if<Colour>(Find(ColourKey(id))); }

    /// Everything that `over` sets wins over what stands here.
    void Merge(AttSet const & over);

    [[nodiscard]] bool Empty() const { return m_Entries.empty(); }
    [[nodiscard]] std::vector<Entry> const & Entries() const { return m_Entries; }

    void Save(ByteWriter & out) const;
    /// False if the bytes are not a set; it is then empty.
    [[nodiscard]] bool Load(ByteReader & in);
    void AccumulateHash(Kernel::HashAccumulator & hash) const;

    friend bool operator==(AttSet const &, AttSet const &) = default;

private:
    void Set(std::uint16_t key, Value value);
    [[nodiscard]] Value const * Find(std::uint16_t key) const;

    std::vector<Entry> m_Entries;
};

}
