#include "framework/story/AttSet.h"

#include "framework/kernel/HashAccumulator.h"
#include "framework/story/ByteStream.h"

#include <algorithm>

namespace Story
{

namespace
{

constexpr int TypeShift = 14;

void HashColour(Kernel::HashAccumulator & hash, Colour const & colour)
{
    hash.Add(colour.m_Space);
    for (float const component : colour.m_Components) {
        hash.Add(component);
    }
}

auto LowerBound(auto & entries, std::uint16_t key)
{
    return std::lower_bound(entries.begin(), entries.end(), key,
                            [](AttSet::Entry const & entry, std::uint16_t k) { return entry.m_Key < k; });
}

}

void AttSet::Set(std::uint16_t key, Value value)
{
    auto const place = LowerBound(m_Entries, key);
    if (place != m_Entries.end() && place->m_Key == key) {
        place->m_Value = std::move(value);
    } else {
        m_Entries.insert(place, Entry{key, std::move(value)});
    }
}

void AttSet::Remove(std::uint16_t key)
{
    auto const place = LowerBound(m_Entries, key);
    if (place != m_Entries.end() && place->m_Key == key) {
        m_Entries.erase(place);
    }
}

AttSet::Value const * AttSet::Find(std::uint16_t key) const
{
    auto const place = LowerBound(m_Entries, key);
    return place != m_Entries.end() && place->m_Key == key ? &place->m_Value : nullptr;
}

void AttSet::Merge(AttSet const & over)
{
    for (Entry const & entry : over.m_Entries) {
        Set(entry.m_Key, entry.m_Value);
    }
}

void AttSet::Save(ByteWriter & out) const
{
    out.Write(static_cast<std::uint16_t>(m_Entries.size()));
    for (Entry const & entry : m_Entries) {
        out.Write(entry.m_Key);
        if (auto const * number = std::get_if<std::int32_t>(&entry.m_Value)) {
            out.Write(*number);
        } else if (auto const * real = std::get_if<double>(&entry.m_Value)) {
            out.Write(*real);
        } else if (auto const * text = std::get_if<String>(&entry.m_Value)) {
            out.WriteString(*text);
        } else {
            auto const & colour = std::get<Colour>(entry.m_Value);
            out.Write(colour.m_Space);
            out.WriteBytes(colour.m_Components.data(), sizeof(colour.m_Components));
        }
    }
}

bool AttSet::Load(ByteReader & in)
{
    m_Entries.clear();
    auto const count = in.Read<std::uint16_t>();
    for (unsigned i = 0; i < count && !in.HasFailed(); ++i) {
        auto const key = in.Read<std::uint16_t>();
        if (!m_Entries.empty() && key <= m_Entries.back().m_Key) {
            in.Fail();
            break;
        }
        Value value;
        switch (key >> TypeShift) {
        case 0:
            value = in.Read<std::int32_t>();
            break;
        case 1:
            value = in.Read<double>();
            break;
        case 2:
            value = in.ReadString();
            break;
        default: {
            Colour colour;
            colour.m_Space = in.Read<Colour::Space>();
            if (colour.m_Space > Colour::Space::Lab) {
                in.Fail();
            }
            for (float & component : colour.m_Components) {
                component = in.Read<float>();
            }
            value = colour;
        }
        }
        m_Entries.push_back({key, std::move(value)});
    }
    if (in.HasFailed()) {
        m_Entries.clear();
        return false;
    }
    return true;
}

void AttSet::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    hash.Add(static_cast<std::uint64_t>(m_Entries.size()));
    for (Entry const & entry : m_Entries) {
        hash.Add(entry.m_Key);
        if (auto const * number = std::get_if<std::int32_t>(&entry.m_Value)) {
            hash.Add(*number);
        } else if (auto const * real = std::get_if<double>(&entry.m_Value)) {
            hash.Add(*real);
        } else if (auto const * text = std::get_if<String>(&entry.m_Value)) {
            hash.Add(*text);
        } else {
            HashColour(hash, std::get<Colour>(entry.m_Value));
        }
    }
}

}
