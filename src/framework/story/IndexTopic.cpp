#include "framework/story/IndexTopic.h"

#include "framework/kernel/Uuid.h"

#include <algorithm>

namespace Story
{

namespace
{

std::atomic<std::uint64_t> s_guidVersion{1};
std::atomic<std::uint64_t> s_nameVersion{1};

}

String IndexTopic::GetName() const
{
    std::lock_guard const lock(m_Lock);
    return m_Name;
}

void IndexTopic::SetName(String const & name)
{
    {
        std::lock_guard const lock(m_Lock);
        m_Name = name;
    }
    ++s_nameVersion;
}

String IndexTopic::GetNameWithParents() const
{
    String name = GetName();
    for (auto parent = GetParent(); parent; parent = parent->GetParent()) {
        name = parent->GetName() + std::string_view(&NameSeparator, 1) + name.View();
    }
    return name;
}

String IndexTopic::GetGUID() const
{
    std::lock_guard const lock(m_Lock);
    return m_GUID;
}

void IndexTopic::SetGUID(String const & guid)
{
    {
        std::lock_guard const lock(m_Lock);
        m_GUID = guid;
    }
    ++s_guidVersion;
}

bool IndexTopic::HasGUID() const
{
    return !GetGUID().Empty();
}

void IndexTopic::AssignNewGUID()
{
    SetGUID(Kernel::Uuid().ToString());
}

String IndexTopic::GetSortString() const
{
    std::lock_guard const lock(m_Lock);
    return m_SortString;
}

void IndexTopic::SetSortString(String const & text)
{
    std::lock_guard const lock(m_Lock);
    m_SortString = text;
}

Kernel::Counted<IndexTopic const> IndexTopic::GetParent() const
{
    std::lock_guard const lock(m_Lock);
    return m_Parent;
}

void IndexTopic::SetParent(Kernel::Counted<IndexTopic const> const & parent)
{
    if (parent && (parent.Get() == this || parent->IsBelow(*this))) {
        return;
    }
    Kernel::Counted<IndexTopic const> old = parent;
    {
        std::lock_guard const lock(m_Lock);
        m_Parent.Swap(old);
    }
    ++s_nameVersion;
}

bool IndexTopic::IsBelow(IndexTopic const & other) const
{
    for (auto parent = GetParent(); parent; parent = parent->GetParent()) {
        if (parent.Get() == &other) {
            return true;
        }
    }
    return false;
}

IndexTopic::CrossReferences IndexTopic::GetCrossReferences() const
{
    std::lock_guard const lock(m_Lock);
    return m_CrossReferences;
}

bool IndexTopic::IsDirectlyRelatedTo(Kernel::Counted<IndexTopic const> const & other) const
{
    std::lock_guard const lock(m_Lock);
    return std::find(m_CrossReferences.begin(), m_CrossReferences.end(), other) != m_CrossReferences.end();
}

bool IndexTopic::AddCrossReference(Kernel::Counted<IndexTopic const> const & other)
{
    if (!other || other.Get() == this) {
        return false;
    }
    std::lock_guard const lock(m_Lock);
    if (std::find(m_CrossReferences.begin(), m_CrossReferences.end(), other) != m_CrossReferences.end()) {
        return false;
    }
    m_CrossReferences.push_back(other);
    return true;
}

bool IndexTopic::RemoveCrossReference(Kernel::Counted<IndexTopic const> const & other)
{
    Kernel::Counted<IndexTopic const> removed;
    std::lock_guard const lock(m_Lock);
    auto const place = std::find(m_CrossReferences.begin(), m_CrossReferences.end(), other);
    if (place == m_CrossReferences.end()) {
        return false;
    }
    removed = *place;
    m_CrossReferences.erase(place);
    return true;
}

void IndexTopic::SetCrossReferences(CrossReferences references)
{
    std::lock_guard const lock(m_Lock);
    m_CrossReferences.swap(references);
}

std::uint64_t IndexTopic::GetGUIDVersion()
{
    return s_guidVersion;
}

std::uint64_t IndexTopic::GetNameVersion()
{
    return s_nameVersion;
}

}
