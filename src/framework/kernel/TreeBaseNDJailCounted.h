#pragma once

#include "framework/kernel/Assert.h"
#include "framework/kernel/Counted.h"

#include <array>
#include <cstddef>
#include <utility>
#include <vector>

namespace Kernel
{

/// A tree whose nodes keep their children in several ordered lists. `T` derives from this and is `Countable`.
///
/// A parent owns its children; a child knows its parent by a plain pointer, which is null for a root and for a node
/// that was taken out. A node stands in one place at a time. Changing the tree is for the thread that holds the writer
/// lock of whatever owns it; reading needs the reader lock.
template <typename T, std::size_t ListCount, typename TList>
class TreeBaseNDJailCounted
{
public:
    using ChildList = std::vector<JailCounted<T>>;

    static constexpr std::size_t ChildListCount = ListCount;

    [[nodiscard]] T * GetParent() const { return m_Parent; }
    /// The list of the parent that this node stands in. Only for a node with a parent.
    [[nodiscard]] TList GetParentList() const { return m_ParentList; }
    /// Position among the siblings of the same list, from 0; -1 without a parent.
    [[nodiscard]] int GetNodeIndex() const { return m_Parent ? m_Index : -1; }

    [[nodiscard]] int GetChildCount(TList list) const { return static_cast<int>(List(list).size()); }
    /// Null if the index is out of range.
    [[nodiscard]] JailCounted<T> GetChildAtIndex(TList list, int index) const
    {
        return index < 0 || index >= GetChildCount(list) ? JailCounted<T>() : List(list)[static_cast<std::size_t>(index)];
    }
    [[nodiscard]] ChildList const & GetChildren(TList list) const { return List(list); }

    /// Puts a node without a parent at `index` of the list (at the end, if that is its length).
    void InsertChild(TList list, int index, JailCounted<T> const & child)
    {
        KORVANE_ASSERT(child && !child->m_Parent);
        KORVANE_ASSERT(0 <= index && index <= GetChildCount(list));
        ChildList & children = List(list);
        children.insert(children.begin() + index, child);
        child->m_Parent = static_cast<T *>(this);
        child->m_ParentList = list;
        Renumber(children, index);
    }
    void AppendChild(TList list, JailCounted<T> const & child) { InsertChild(list, GetChildCount(list), child); }

    /// Takes the node at `index` out of the list and gives it back.
    JailCounted<T> RemoveChild(TList list, int index)
    {
        KORVANE_ASSERT(0 <= index && index < GetChildCount(list));
        ChildList & children = List(list);
        JailCounted<T> const child = children[static_cast<std::size_t>(index)];
        children.erase(children.begin() + index);
        child->m_Parent = nullptr;
        Renumber(children, index);
        return child;
    }

    /// Takes out all nodes of the list and gives them back in their order.
    ChildList RemoveChildren(TList list)
    {
        ChildList children = std::exchange(List(list), {});
        for (JailCounted<T> const & child : children) {
            child->m_Parent = nullptr;
        }
        return children;
    }

    /// Fills an empty list.
    void SetChildren(TList list, ChildList children)
    {
        KORVANE_ASSERT(List(list).empty());
        List(list) = std::move(children);
        for (JailCounted<T> const & child : List(list)) {
            KORVANE_ASSERT(!child->m_Parent);
            child->m_Parent = static_cast<T *>(this);
            child->m_ParentList = list;
        }
        Renumber(List(list), 0);
    }

protected:
    TreeBaseNDJailCounted() = default;
    TreeBaseNDJailCounted(TreeBaseNDJailCounted const &) = delete;
    TreeBaseNDJailCounted & operator=(TreeBaseNDJailCounted const &) = delete;
    /// Children that others still hold become roots.
    ~TreeBaseNDJailCounted()
    {
        for (ChildList const & children : m_Lists) {
            for (JailCounted<T> const & child : children) {
                child->m_Parent = nullptr;
            }
        }
    }

private:
    ChildList & List(TList list) { return m_Lists[static_cast<std::size_t>(list)]; }
    ChildList const & List(TList list) const { return m_Lists[static_cast<std::size_t>(list)]; }

    static void Renumber(ChildList const & children, int from)
    {
        for (std::size_t i = static_cast<std::size_t>(from); i < children.size(); ++i) {
            children[i]->m_Index = static_cast<int>(i);
        }
    }

    std::array<ChildList, ListCount> m_Lists;
    T * m_Parent = nullptr;
    int m_Index = -1;
    TList m_ParentList{};
};

}
