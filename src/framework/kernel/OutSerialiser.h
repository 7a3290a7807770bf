#pragma once

#include "framework/kernel/Geometry.h"
#include "framework/kernel/Serialisable.h"
#include "framework/kernel/SerialiserTraits.h"
#include "framework/kernel/StringT.h"

#include <cstdint>
#include <span>
#include <string>
#include <unordered_map>
#include <vector>

namespace Kernel
{

class FileStoreOut;

/// Writes the fields of objects into a tagged stream, each under its tag, in the order of the calls. A field is found
/// by its tag on reading, so the order matters to nobody but who compares bytes. One tag is used once in an object.
///
/// In a run that only collects paths (`IsFullSave` is false) nothing is written, and objects are walked all the same.
class OutSerialiser
{
public:
    virtual ~OutSerialiser() = default;
    OutSerialiser(OutSerialiser const &) = delete;
    OutSerialiser & operator=(OutSerialiser const &) = delete;

    void SaveType(IDTag tag, bool const & value) { SaveTypeI(tag, PropType::Bool, &value, sizeof(value)); }
    void SaveType(IDTag tag, String const & value) { SaveTypeI(tag, PropType::String, value.Data(), value.Length()); }
    /// Numbers, enumerations, tags and time stamps.
    template <SerialisableScalar T>
    void SaveType(IDTag tag, T const & value)
    {
        SaveTypeI(tag, GetPropType<T>(), &value, sizeof(value));
    }
    void SaveType(IDTag tag, PointT<double> const & value);
    void SaveType(IDTag tag, SizeT<double> const & value);
    void SaveType(IDTag tag, RectT<double> const & value);
    void SaveType(IDTag tag, std::u16string const & value) { SaveArray(tag, std::span(value.data(), value.size())); }
    void SaveType(IDTag tag, std::vector<String> const & values);
    /// A literal would silently become a `bool`.
    template <typename T>
    void SaveType(IDTag tag, T * value) = delete;

    /// A run of elements as one block, such as a text buffer or the glyphs of a line. Its bytes start at a multiple
    /// of 8.
    template <SerialisableElement T>
    void SaveArray(IDTag tag, std::span<T const> values)
    {
        SaveArrayI(tag, values.data(), sizeof(T), values.size());
    }
    template <SerialisableElement T>
    void SaveArray(IDTag tag, std::vector<T> const & values)
    {
        SaveArrayI(tag, values.data(), sizeof(T), values.size());
    }
    void SaveData(IDTag tag, std::span<std::uint8_t const> bytes) { SaveArray(tag, bytes); }

    /// An object of any registered class. A null one is written as such if `writeNull`, and left out otherwise.
    void SaveObject(IDTag tag, NonCounted<Serialisable const> object, bool writeNull);
    /// A list of objects; null ones keep their place.
    template <typename T>
    void SaveObjects(IDTag tag, std::vector<Counted<T>> const & objects)
    {
        if (StartObjectArrayTestI(tag, objects.size())) {
            StartObjectArrayBeginI(tag, objects.size());
            for (Counted<T> const & object : objects) {
                SaveObjectI(tag, object, true);
            }
        }
    }
    /// The same by hand: `StartObjectArrayTestI` says whether the array is to be written, `StartObjectArrayBeginI`
    /// begins it, and exactly `count` calls of `SaveObjectI` with the same tag follow.
    [[nodiscard]] bool StartObjectArrayTestI(IDTag tag, unsigned long long count) const;
    void StartObjectArrayBeginI(IDTag tag, unsigned long long count);
    void SaveObjectI(IDTag tag, NonCounted<Serialisable const> object, bool writeNull);
    /// A value that may be referred to from many places: the stream holds each such object once, and on reading all
    /// places get the same object again. Null is kept.
    void SaveSharedObject(IDTag tag, Consolidated<SharedSerialisable> const & object);

    /// The path of the file that is being written, for objects that keep paths relative to it.
    void SetFilePath(String const & path) { m_FilePath = path; }
    [[nodiscard]] String const & GetFilePath() const { return m_FilePath; }

    [[nodiscard]] bool IsFullSave() const;
    /// Walks an object only for the paths that it refers to.
    void SaveObjectEnumeratePathsOnlyI(NonCounted<Serialisable const> object);
    /// Called by objects for each file that they refer to.
    void ReferToPath(String const & path);

    [[nodiscard]] FileStoreOut & GetStore() const { return m_Store; }

protected:
    OutSerialiser(FileStoreOut & store, CompareContext const * context);

    [[nodiscard]] std::vector<std::uint8_t> const & GetBytes() const { return m_Bytes; }
    void WriteObject(Serialisable const & object);
    /// No object or array is open.
    [[nodiscard]] bool IsBalanced() const { return m_Depth == 0 && m_ArrayRest == 0; }

private:
    void SaveTypeI(IDTag tag, PropType type, void const * data, unsigned long long size);
    void SaveArrayI(IDTag tag, void const * data, std::size_t elementSize, std::size_t count);
    [[nodiscard]] bool IsLeftOut(IDTag tag) const;
    [[nodiscard]] bool IsDefault(IDTag tag, PropType type, void const * data, unsigned long long size) const;
    std::size_t BeginField(IDTag tag, PropType type);
    void EndField(std::size_t start);
    void Put(void const * data, std::size_t size);
    template <typename T>
    void PutNumber(T value)
    {
        Put(&value, sizeof(value));
    }
    void PutTag(std::uint32_t tag);

    FileStoreOut & m_Store;
    CompareContext const * const m_Context;
    String m_FilePath;
    std::vector<std::uint8_t> m_Bytes;
    ClassProperties const * m_Class = nullptr;
    int m_Depth = 0;
    bool m_PathsOnly;
    // The object array that is being written: its tag, its field, elements still to come.
    IDTag m_ArrayTag;
    std::size_t m_ArrayStart = 0;
    unsigned long long m_ArrayRest = 0;
    std::unordered_map<SharedSerialisable const *, std::uint64_t> m_Shared;
    // Keeps the addresses in m_Shared from being used anew.
    std::vector<Consolidated<SharedSerialisable>> m_SharedKept;
};

}
