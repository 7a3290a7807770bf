#include "framework/kernel/InSerialiser.h"

#include "framework/kernel/ArchiveExceptions.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/InSerialiserContext.h"
#include "framework/kernel/TaggedStreamFormat.h"

#include <algorithm>
#include <utility>

namespace Kernel
{

using namespace TaggedStream;

String InSerialiser::Context::PlaceOf(std::uint8_t const * at) const
{
    return Format(LocalisedString("byte %1", "Damage"), at - m_Buffer->GetData());
}

void InSerialiser::Context::CheckDepth(int levels, std::uint8_t const * at) const
{
    if (MaximumDepth <= levels) {
        throw ArchiveCorruptionException(
            m_SourceName, PlaceOf(at),
            LocalisedString("values refer to each other in too long a chain", "Damage"));
    }
}

bool InSerialiser::Find(IDTag tag, PropType type, std::span<std::uint8_t const> & payload) const
{
    // From the cursor to the end, then from the start to the cursor. The headers were checked by the parser.
    std::size_t at = m_Cursor;
    bool wrapped = m_Cursor == 0;
    for (;;) {
        if (at == m_Fields.size()) {
            if (wrapped) {
                return false;
            }
            wrapped = true;
            at = 0;
            continue;
        }
        std::uint8_t const * const header = m_Fields.data() + at;
        std::size_t const length = GetNumber<std::uint64_t>(header + 8);
        std::size_t const next = at + FieldHeaderSize + Padded(length);
        if (GetTag(header) == tag.Value() && header[4] == static_cast<std::uint8_t>(type)) {
            payload = m_Fields.subspan(at + FieldHeaderSize, length);
            m_Cursor = next;
            return true;
        }
        at = next;
        if (wrapped && 0 < m_Cursor && m_Cursor <= at) {
            return false;
        }
    }
}

bool InSerialiser::LoadTypeI(IDTag tag, PropType type, void * target, unsigned long long size) const
{
    std::span<std::uint8_t const> payload;
    if (!Find(tag, type, payload) || payload.size() != size) {
        return false;
    }
    std::memcpy(target, payload.data(), size);
    return true;
}

bool InSerialiser::LoadType(IDTag tag, bool & value) const
{
    // Read as a number: a byte other than 0 and 1 is no `bool`.
    std::uint8_t byte = 0;
    if (!LoadTypeI(tag, PropType::Bool, &byte, sizeof(byte))) {
        return false;
    }
    value = byte != 0;
    return true;
}

bool InSerialiser::LoadType(IDTag tag, String & value) const
{
    std::span<std::uint8_t const> payload;
    if (!Find(tag, PropType::String, payload)) {
        return false;
    }
    value = String(reinterpret_cast<char const *>(payload.data()), payload.size());
    return true;
}

bool InSerialiser::LoadType(IDTag tag, PointT<double> & value) const
{
    std::span<double const> numbers;
    if (!LoadView(tag, numbers) || numbers.size() != 2) {
        return false;
    }
    value.x = numbers[0];
    value.y = numbers[1];
    return true;
}

bool InSerialiser::LoadType(IDTag tag, SizeT<double> & value) const
{
    std::span<double const> numbers;
    if (!LoadView(tag, numbers) || numbers.size() != 2) {
        return false;
    }
    value.width = numbers[0];
    value.height = numbers[1];
    return true;
}

bool InSerialiser::LoadType(IDTag tag, RectT<double> & value) const
{
    std::span<double const> numbers;
    if (!LoadView(tag, numbers) || numbers.size() != 4) {
        return false;
    }
    value.left = numbers[0];
    value.top = numbers[1];
    value.right = numbers[2];
    value.bottom = numbers[3];
    return true;
}

bool InSerialiser::LoadType(IDTag tag, std::u16string & value) const
{
    std::span<char16_t const> units;
    if (!LoadView(tag, units)) {
        return false;
    }
    value.assign(units.begin(), units.end());
    return true;
}

bool InSerialiser::LoadType(IDTag tag, std::vector<String> & values) const
{
    std::span<std::uint8_t const> payload;
    if (!Find(tag, PropType::StringArray, payload)) {
        return false;
    }
    std::vector<String> loaded;
    loaded.reserve(GetNumber<std::uint64_t>(payload.data()));
    for (std::size_t at = sizeof(std::uint64_t); at < payload.size();) {
        std::size_t const length = GetNumber<std::uint32_t>(payload.data() + at);
        at += sizeof(std::uint32_t);
        loaded.emplace_back(reinterpret_cast<char const *>(payload.data() + at), length);
        at += length;
    }
    values = std::move(loaded);
    return true;
}

bool InSerialiser::LoadArrayI(IDTag tag, std::size_t elementSize, std::span<std::uint8_t const> & bytes) const
{
    std::span<std::uint8_t const> payload;
    if (!Find(tag, PropType::Array, payload) || GetNumber<std::uint64_t>(payload.data()) != elementSize) {
        return false;
    }
    bytes = payload.subspan(sizeof(std::uint64_t));
    return true;
}

Counted<Serialisable> InSerialiser::MakeObject(std::span<std::uint8_t const> payload) const
{
    if (payload.empty()) {
        return nullptr;
    }
    ClassUID const uid(GetTag(payload.data()));
    auto const version = GetNumber<std::uint16_t>(payload.data() + 4);
    ClassProperties const * const properties = ClassProperties::Find(uid);
    if (!properties || !properties->GetCreator()) {
        return nullptr;
    }
    if (properties->GetVersion() < version) {
        throw FutureVersionException(m_Context->m_SourceName, uid, version, properties->GetVersion());
    }
    int const outerHeight = std::exchange(m_Context->m_Height, 0);
    m_Context->CheckDepth(m_Context->m_Depth, payload.data());
    Counted<Serialisable> object = properties->GetCreator()();
    InSerialiser const fields(*m_Context, payload.subspan(ObjectHeaderSize));
    ++m_Context->m_Depth;
    bool const usable = object && object->Load(fields, m_Context->m_Store, version);
    --m_Context->m_Depth;
    m_Context->CheckDepth(m_Context->m_Height, payload.data());
    m_Context->m_Height = std::max(outerHeight, m_Context->m_Height + 1);
    return usable ? object : nullptr;
}

bool InSerialiser::LoadObjectI(IDTag tag, Counted<Serialisable> & object, bool keepNull) const
{
    std::span<std::uint8_t const> payload;
    if (!Find(tag, PropType::Object, payload)) {
        return false;
    }
    Counted<Serialisable> loaded = MakeObject(payload);
    if (!loaded && !keepNull) {
        return false;
    }
    object = std::move(loaded);
    return true;
}

std::optional<std::vector<Counted<Serialisable>>> InSerialiser::LoadObjectsI(IDTag tag, bool keepNull) const
{
    std::span<std::uint8_t const> payload;
    if (!Find(tag, PropType::ObjectArray, payload)) {
        return std::nullopt;
    }
    std::vector<Counted<Serialisable>> objects;
    objects.reserve(GetNumber<std::uint64_t>(payload.data()));
    for (std::size_t at = sizeof(std::uint64_t); at < payload.size();) {
        std::size_t const length = GetNumber<std::uint64_t>(payload.data() + at + 8);
        Counted<Serialisable> object = MakeObject(payload.subspan(at + FieldHeaderSize, length));
        if (object || keepNull) {
            objects.push_back(std::move(object));
        }
        at += FieldHeaderSize + Padded(length);
    }
    return objects;
}

bool InSerialiser::LoadSharedObjectI(IDTag tag, Consolidated<SharedSerialisable> & object) const
{
    std::span<std::uint8_t const> payload;
    if (!Find(tag, PropType::SharedObject, payload)) {
        return false;
    }
    if (payload.empty()) {
        object = nullptr;
        return true;
    }
    Context::Shared & shared = m_Context->m_Shared[GetNumber<std::uint64_t>(payload.data())];
    if (!shared.m_Object && !shared.m_Payload.empty()) {
        if (shared.m_Loading) {
            throw ArchiveCorruptionException(m_Context->m_SourceName, m_Context->PlaceOf(payload.data()),
                                             LocalisedString("a shared value that holds itself", "Damage"));
        }
        shared.m_Loading = true;
        int const outerHeight = std::exchange(m_Context->m_Height, 0);
        Counted<Serialisable> const made = MakeObject(shared.m_Payload);
        shared.m_Object = Consolidated<SharedSerialisable>(CountedCast<SharedSerialisable const>(made));
        shared.m_Loading = false;
        shared.m_Height = m_Context->m_Height;
        m_Context->m_Height = outerHeight;
    }
    m_Context->m_Height = std::max(m_Context->m_Height, shared.m_Height);
    object = shared.m_Object;
    return true;
}

bool InSerialiser::HasField(IDTag tag) const
{
    for (std::size_t at = 0; at < m_Fields.size();) {
        if (GetTag(m_Fields.data() + at) == tag.Value()) {
            return true;
        }
        at += FieldHeaderSize + Padded(GetNumber<std::uint64_t>(m_Fields.data() + at + 8));
    }
    return false;
}

FileStore & InSerialiser::GetStore() const
{
    return m_Context->m_Store;
}

Counted<RawData const> InSerialiser::GetBuffer() const
{
    return m_Context->m_Buffer;
}

}
