#pragma once

#include "framework/kernel/FileStore.h"
#include "framework/kernel/Geometry.h"
#include "framework/kernel/Serialisable.h"
#include "framework/kernel/SerialiserTraits.h"
#include "framework/kernel/StringT.h"

#include <cstring>
#include <optional>
#include <span>
#include <string>
#include <vector>

namespace Kernel
{

/// Reads the fields of one object of a tagged stream. A field is found by its tag, fastest in the order in which it was
/// written. For a missing tag a load call returns false and leaves its target as it was; a field of another type
/// counts as missing. Nothing is copied before it is asked for. One thread at a time.
///
/// The structure of the whole stream was checked before the first field is read, so that damage shows at the start and
/// not in the middle.
class InSerialiser
{
public:
    /// What `InSerialiserFile::ParseWithChecks` checks beyond the structure.
    enum class DelayLoadsBehaviour
    {
        /// The versions of all classes in the stream, nested ones included.
        CheckAll = 0,
        /// The version of a nested object only when it is loaded.
        Delay = 1,
    };

    InSerialiser(InSerialiser const &) = delete;
    InSerialiser & operator=(InSerialiser const &) = delete;

    bool LoadType(IDTag tag, bool & value) const;
    bool LoadType(IDTag tag, String & value) const;
    template <SerialisableScalar T>
    bool LoadType(IDTag tag, T & value) const
    {
        return LoadTypeI(tag, GetPropType<T>(), &value, sizeof(value));
    }
    bool LoadType(IDTag tag, PointT<double> & value) const;
    bool LoadType(IDTag tag, SizeT<double> & value) const;
    bool LoadType(IDTag tag, RectT<double> & value) const;
    bool LoadType(IDTag tag, std::u16string & value) const;
    bool LoadType(IDTag tag, std::vector<String> & values) const;

    /// A copy of a run of elements. False, too, if the elements in the stream are of another size.
    template <SerialisableElement T>
    bool LoadArray(IDTag tag, std::vector<T> & values) const
    {
        std::span<T const> view;
        if (!LoadView(tag, view)) {
            return false;
        }
        values.assign(view.begin(), view.end());
        return true;
    }
    /// The elements where they lie, without a copy: valid while the block of `GetBuffer` lives.
    template <SerialisableElement T>
    bool LoadView(IDTag tag, std::span<T const> & values) const
    {
        std::span<std::uint8_t const> bytes;
        if (!LoadArrayI(tag, sizeof(T), bytes)) {
            return false;
        }
        values = {reinterpret_cast<T const *>(bytes.data()), bytes.size() / sizeof(T)};
        return true;
    }
    bool LoadData(IDTag tag, std::span<std::uint8_t const> & bytes) const { return LoadView(tag, bytes); }

    /// An object, of whichever class the stream says. One that is null in the stream, of a class that nobody has
    /// registered, or refused by its own `Load` gives null and true with `keepNull`; without it the field counts as
    /// missing.
    bool LoadObjectI(IDTag tag, Counted<Serialisable> & object, bool keepNull) const;
    /// All objects of an array, or nothing if there is no such field. With `keepNull` null objects keep their places;
    /// without it they are left out.
    [[nodiscard]] std::optional<std::vector<Counted<Serialisable>>> LoadObjectsI(IDTag tag, bool keepNull) const;
    /// A shared value: every place that refers to the same one gets the same object.
    bool LoadSharedObjectI(IDTag tag, Consolidated<SharedSerialisable> & object) const;

    /// The same for a class that the caller knows; an object of another class becomes null.
    template <typename T>
    bool LoadObject(IDTag tag, Counted<T> & object) const
    {
        Counted<Serialisable> loaded;
        if (!LoadObjectI(tag, loaded, true)) {
            return false;
        }
        object = CountedCast<T>(loaded);
        return true;
    }
    template <typename T>
    bool LoadObjects(IDTag tag, std::vector<Counted<T>> & objects) const
    {
        auto const loaded = LoadObjectsI(tag, true);
        if (!loaded) {
            return false;
        }
        objects.clear();
        objects.reserve(loaded->size());
        for (Counted<Serialisable> const & object : *loaded) {
            objects.push_back(CountedCast<T>(object));
        }
        return true;
    }
    template <typename T>
    bool LoadSharedObject(IDTag tag, Consolidated<T> & object) const
    {
        Consolidated<SharedSerialisable> loaded;
        if (!LoadSharedObjectI(tag, loaded)) {
            return false;
        }
        object = Consolidated<T>(CountedCast<T const>(loaded.GetCounted()));
        return true;
    }

    [[nodiscard]] bool HasField(IDTag tag) const;
    /// The store that the stream lies in.
    [[nodiscard]] FileStore & GetStore() const;
    /// The memory that all views point into: keep it to keep them.
    [[nodiscard]] Counted<RawData const> GetBuffer() const;

protected:
    struct Context;

    InSerialiser(Context & context, std::span<std::uint8_t const> fields) : m_Context(&context), m_Fields(fields) {}
    ~InSerialiser() = default;

private:
    struct Field;

    bool LoadTypeI(IDTag tag, PropType type, void * target, unsigned long long size) const;
    bool LoadArrayI(IDTag tag, std::size_t elementSize, std::span<std::uint8_t const> & bytes) const;
    bool Find(IDTag tag, PropType type, std::span<std::uint8_t const> & payload) const;
    [[nodiscard]] Counted<Serialisable> MakeObject(std::span<std::uint8_t const> payload) const;

    Context * m_Context;
    std::span<std::uint8_t const> m_Fields;
    // Where the next search starts: behind the field found last.
    mutable std::size_t m_Cursor = 0;
};

}
