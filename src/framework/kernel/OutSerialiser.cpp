#include "framework/kernel/OutSerialiser.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/FileStore.h"
#include "framework/kernel/TaggedStreamFormat.h"

#include <utility>

namespace Kernel
{

using namespace TaggedStream;

OutSerialiser::OutSerialiser(FileStoreOut & store, CompareContext const * context)
    : m_Store(store),
      m_Context(context),
      m_PathsOnly(!store.IsFullSave())
{
}

bool OutSerialiser::IsFullSave() const
{
    return m_Store.IsFullSave();
}

void OutSerialiser::ReferToPath(String const & path)
{
    m_Store.ReferToPath(path);
}

void OutSerialiser::SaveType(IDTag tag, PointT<double> const & value)
{
    double const numbers[] = {value.x, value.y};
    SaveArrayI(tag, numbers, sizeof(double), 2);
}

void OutSerialiser::SaveType(IDTag tag, SizeT<double> const & value)
{
    double const numbers[] = {value.width, value.height};
    SaveArrayI(tag, numbers, sizeof(double), 2);
}

void OutSerialiser::SaveType(IDTag tag, RectT<double> const & value)
{
    double const numbers[] = {value.left, value.top, value.right, value.bottom};
    SaveArrayI(tag, numbers, sizeof(double), 4);
}

void OutSerialiser::SaveType(IDTag tag, std::vector<String> const & values)
{
    if (IsLeftOut(tag)) {
        return;
    }
    std::size_t const start = BeginField(tag, PropType::StringArray);
    PutNumber(static_cast<std::uint64_t>(values.size()));
    for (String const & value : values) {
        PutNumber(static_cast<std::uint32_t>(value.Length()));
        Put(value.Data(), value.Length());
    }
    EndField(start);
}

void OutSerialiser::SaveTypeI(IDTag tag, PropType type, void const * data, unsigned long long size)
{
    KORVANE_ASSERT(FixedSize(type) == 0 || FixedSize(type) == size);
    if (IsLeftOut(tag) || IsDefault(tag, type, data, size)) {
        return;
    }
    std::size_t const start = BeginField(tag, type);
    Put(data, size);
    EndField(start);
}

void OutSerialiser::SaveArrayI(IDTag tag, void const * data, std::size_t elementSize, std::size_t count)
{
    if (IsLeftOut(tag)) {
        return;
    }
    std::size_t const start = BeginField(tag, PropType::Array);
    PutNumber(static_cast<std::uint64_t>(elementSize));
    Put(data, elementSize * count);
    EndField(start);
}

void OutSerialiser::SaveObject(IDTag tag, NonCounted<Serialisable const> object, bool writeNull)
{
    KORVANE_ASSERT_MESSAGE(m_ArrayRest == 0, "a field inside an object array that is not complete");
    if (m_PathsOnly) {
        SaveObjectEnumeratePathsOnlyI(object);
        return;
    }
    if (IsLeftOut(tag) || (!object && !writeNull)) {
        return;
    }
    std::size_t const start = BeginField(tag, PropType::Object);
    if (object) {
        WriteObject(*object);
    }
    EndField(start);
}

bool OutSerialiser::StartObjectArrayTestI(IDTag tag, unsigned long long) const
{
    KORVANE_ASSERT_MESSAGE(m_ArrayRest == 0, "object arrays do not lie in each other without an object between");
    return m_PathsOnly || !IsLeftOut(tag);
}

void OutSerialiser::StartObjectArrayBeginI(IDTag tag, unsigned long long count)
{
    if (m_PathsOnly) {
        return;
    }
    std::size_t const start = BeginField(tag, PropType::ObjectArray);
    PutNumber(static_cast<std::uint64_t>(count));
    m_ArrayTag = tag;
    m_ArrayStart = start;
    m_ArrayRest = count;
    if (count == 0) {
        EndField(start);
    }
}

void OutSerialiser::SaveObjectI(IDTag tag, NonCounted<Serialisable const> object, bool)
{
    if (m_PathsOnly) {
        SaveObjectEnumeratePathsOnlyI(object);
        return;
    }
    KORVANE_ASSERT_MESSAGE(0 < m_ArrayRest && m_ArrayTag == tag, "an element outside of its object array");
    // The element may hold arrays of its own.
    std::size_t const arrayStart = m_ArrayStart;
    unsigned long long const rest = std::exchange(m_ArrayRest, 0) - 1;
    std::size_t const start = BeginField(tag, PropType::Object);
    if (object) {
        WriteObject(*object);
    }
    EndField(start);
    m_ArrayTag = tag;
    m_ArrayStart = arrayStart;
    m_ArrayRest = rest;
    if (rest == 0) {
        EndField(arrayStart);
    }
}

void OutSerialiser::SaveSharedObject(IDTag tag, Consolidated<SharedSerialisable> const & object)
{
    KORVANE_ASSERT_MESSAGE(m_ArrayRest == 0, "a field inside an object array that is not complete");
    if (m_PathsOnly) {
        if (object && m_Shared.emplace(object.Get(), m_Shared.size()).second) {
            m_SharedKept.push_back(object);
            SaveObjectEnumeratePathsOnlyI(object.Get());
        }
        return;
    }
    if (IsLeftOut(tag)) {
        return;
    }
    std::size_t const start = BeginField(tag, PropType::SharedObject);
    if (object) {
        // The number of the object in the order of first mention; its content follows the first mention only.
        auto const [found, isNew] = m_Shared.emplace(object.Get(), m_Shared.size());
        PutNumber(found->second);
        if (isNew) {
            m_SharedKept.push_back(object);
            WriteObject(*object);
        }
    }
    EndField(start);
}

void OutSerialiser::SaveObjectEnumeratePathsOnlyI(NonCounted<Serialisable const> object)
{
    if (!object) {
        return;
    }
    KORVANE_ASSERT_MESSAGE(m_Depth < MaximumDepth, "objects hold each other in a ring");
    bool const before = std::exchange(m_PathsOnly, true);
    ++m_Depth;
    object->Save(*this);
    --m_Depth;
    m_PathsOnly = before;
}

void OutSerialiser::WriteObject(Serialisable const & object)
{
    KORVANE_ASSERT_MESSAGE(m_Depth < MaximumDepth, "objects hold each other in a ring");
    ClassProperties const & properties = object.GetObjectClassProperties();
    PutTag(properties.GetClassUID().Value());
    PutNumber(static_cast<std::uint16_t>(properties.GetVersion()));
    PutNumber(std::uint16_t(0));
    ClassProperties const * const before = std::exchange(m_Class, &properties);
    ++m_Depth;
    object.Save(*this);
    --m_Depth;
    m_Class = before;
    KORVANE_ASSERT_MESSAGE(m_ArrayRest == 0, "an object array got fewer elements than it was begun with");
}

bool OutSerialiser::IsLeftOut(IDTag tag) const
{
    return m_PathsOnly || (m_Context && m_Context->IgnoresField(tag));
}

bool OutSerialiser::IsDefault(IDTag tag, PropType type, void const * data, unsigned long long size) const
{
    if (FixedSize(type) == 0) {
        return false;
    }
    for (ClassProperties const * at = m_Class; at; at = at->GetBase()) {
        for (ClassPropertiesBase::DefaultItem const & item : at->GetDefaults()) {
            if (item.m_Tag == tag) {
                return item.m_Type == type && std::memcmp(&item.m_Bits, data, size) == 0;
            }
        }
    }
    return false;
}

std::size_t OutSerialiser::BeginField(IDTag tag, PropType type)
{
    KORVANE_ASSERT_MESSAGE(m_ArrayRest == 0, "a field inside an object array that is not complete");
    std::size_t const start = m_Bytes.size();
    PutTag(tag.Value());
    PutNumber(static_cast<std::uint32_t>(type));
    PutNumber(std::uint64_t(0));
    return start;
}

void OutSerialiser::EndField(std::size_t start)
{
    std::uint64_t const length = m_Bytes.size() - start - FieldHeaderSize;
    std::memcpy(m_Bytes.data() + start + 8, &length, sizeof(length));
    m_Bytes.resize(Padded(m_Bytes.size()));
}

void OutSerialiser::Put(void const * data, std::size_t size)
{
    auto const * const bytes = static_cast<std::uint8_t const *>(data);
    m_Bytes.insert(m_Bytes.end(), bytes, bytes + size);
}

void OutSerialiser::PutTag(std::uint32_t tag)
{
    std::uint8_t const bytes[] = {static_cast<std::uint8_t>(tag >> 24), static_cast<std::uint8_t>(tag >> 16),
                                  static_cast<std::uint8_t>(tag >> 8), static_cast<std::uint8_t>(tag)};
    Put(bytes, sizeof(bytes));
}

}
