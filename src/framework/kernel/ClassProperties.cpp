#include "framework/kernel/ClassProperties.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/FileStoreItem.h"

#include <unordered_map>

namespace Kernel
{

namespace
{

/// Descriptions by uid. Entered by static objects, which also happens when a library is loaded later on.
template <typename T>
class Registry
{
public:
    static Registry & Get()
    {
        // Made on first use, as the static objects of other sources enter classes before those of this one exist.
        static Registry * const registry = new Registry;
        return *registry;
    }

    void Enter(ClassUID uid, T const & entry)
    {
        ScopedLock lock(m_Lock);
        bool const isNew = m_Entries.emplace(uid.Value(), &entry).second;
        KORVANE_ASSERT_MESSAGE(isNew || m_Entries[uid.Value()] == &entry, "two classes with one uid");
    }

    T const * Find(ClassUID uid) const
    {
        ScopedLock lock(m_Lock);
        auto const found = m_Entries.find(uid.Value());
        return found == m_Entries.end() ? nullptr : found->second;
    }

private:
    CriticalSectionSpin m_Lock;
    std::unordered_map<std::uint32_t, T const *> m_Entries KORVANE_GUARDED_BY(m_Lock);
};

}

ClassPropertiesBase::Init::Init(ClassPropertiesBase const & properties)
{
    Registry<ClassProperties>::Get().Enter(properties.GetClassUID(), static_cast<ClassProperties const &>(properties));
}

ClassProperties const * ClassProperties::Find(ClassUID uid)
{
    return Registry<ClassProperties>::Get().Find(uid);
}

bool ClassProperties::IsKindOf(ClassProperties const & other) const
{
    for (ClassProperties const * at = this; at; at = at->GetBase()) {
        if (at == &other) {
            return true;
        }
    }
    return false;
}

FileStoreItemType::Init::Init(FileStoreItemType const & type)
{
    Registry<FileStoreItemType>::Get().Enter(type.GetClassUID(), type);
}

FileStoreItemType const * FileStoreItemType::Find(ClassUID uid)
{
    return Registry<FileStoreItemType>::Get().Find(uid);
}

}
