#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/IDTag.h"
#include "framework/kernel/PropType.h"

#include <span>

namespace Kernel
{

class Serialisable;

/// What all descriptions of serialisable classes share.
class ClassPropertiesBase
{
public:
    /// A field whose value is not written while it equals this default. A missing field leaves its target as the
    /// constructor made it, so the default has to be the constructor's. Scalar types only.
    struct DefaultItem
    {
        IDTag m_Tag;
        PropType m_Type;
        /// The value's bytes, the least significant first, unused ones zero.
        std::uint64_t m_Bits;
    };

    /// A static object of this class, made from the properties, enters the class in the registry of those that streams
    /// can name. Two classes with one uid are a programming mistake.
    class Init
    {
    public:
        explicit Init(ClassPropertiesBase const & properties);
    };

    [[nodiscard]] constexpr ClassUID GetClassUID() const { return m_ClassUID; }
    /// The version that this program writes; a stream with a higher one is from a later program.
    [[nodiscard]] constexpr unsigned short GetVersion() const { return m_Version; }

protected:
    constexpr ClassPropertiesBase(ClassUID uid, unsigned short version) : m_ClassUID(uid), m_Version(version) {}
    ~ClassPropertiesBase() = default;

private:
    ClassUID m_ClassUID;
    unsigned short m_Version;
};

/// The static description of a serialisable class. Built before any code runs, as all of it is constant.
class ClassProperties : public ClassPropertiesBase
{
public:
    using Creator = Counted<Serialisable> (*)();

    /// `creator` is null for an abstract class, `base` for a class without a serialisable base. The table must outlive
    /// the object.
    constexpr ClassProperties(ClassUID uid, Creator creator, unsigned short version,
                              std::span<DefaultItem const> defaults, ClassProperties const * base)
        : ClassPropertiesBase(uid, version),
          m_Creator(creator),
          m_Defaults(defaults),
          m_Base(base)
    {
    }

    [[nodiscard]] constexpr Creator GetCreator() const { return m_Creator; }
    [[nodiscard]] constexpr std::span<DefaultItem const> GetDefaults() const { return m_Defaults; }
    [[nodiscard]] constexpr ClassProperties const * GetBase() const { return m_Base; }
    /// The class itself, or one that it derives from, has these properties.
    [[nodiscard]] bool IsKindOf(ClassProperties const & other) const;

    /// The class of a uid, or null if none is registered.
    [[nodiscard]] static ClassProperties const * Find(ClassUID uid);

private:
    Creator m_Creator;
    std::span<DefaultItem const> m_Defaults;
    ClassProperties const * m_Base;
};

}
