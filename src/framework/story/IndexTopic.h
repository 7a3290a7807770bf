#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"

#include <cstdint>
#include <mutex>
#include <vector>

namespace Story
{

/// A topic of an index: a name at a place in the tree of topics, with what it is sorted by and what it refers to.
///
/// Identity across documents is the GUID. The object itself is the identity within one document: commands change it in
/// place, so whoever holds it sees the change. Every operation is safe on any thread; a getter returns the value as of
/// some moment of the call. A topic has a place in at most one `Index`, which ties and unties cross-references; the
/// parent is kept alive by its children.
class IndexTopic : public virtual Kernel::Countable
{
public:
    using CrossReferences = std::vector<Kernel::Counted<IndexTopic const>>;

    /// Separates the names in `GetNameWithParents`.
    static constexpr char NameSeparator = '\x1F';

    IndexTopic() = default;

    [[nodiscard]] String GetName() const;
    void SetName(String const & name);
    /// Names from the outermost parent down to this one, separated by `NameSeparator`.
    [[nodiscard]] String GetNameWithParents() const;

    [[nodiscard]] String GetGUID() const;
    void SetGUID(String const & guid);
    [[nodiscard]] bool HasGUID() const;
    void AssignNewGUID();

    /// What the topic is sorted by; empty means its name.
    [[nodiscard]] String GetSortString() const;
    void SetSortString(String const & text);

    /// Null at the top level.
    [[nodiscard]] Kernel::Counted<IndexTopic const> GetParent() const;
    /// Does nothing if `parent` is this topic or stands below it.
    void SetParent(Kernel::Counted<IndexTopic const> const & parent);
    [[nodiscard]] bool IsBelow(IndexTopic const & other) const;

    /// Topics that this one refers to ("see also"), in the order in which they were added.
    [[nodiscard]] CrossReferences GetCrossReferences() const;
    /// This topic refers to `other`.
    [[nodiscard]] bool IsDirectlyRelatedTo(Kernel::Counted<IndexTopic const> const & other) const;
    /// False if the reference is there already, is null, or would lead to the topic itself.
    bool AddCrossReference(Kernel::Counted<IndexTopic const> const & other);
    bool RemoveCrossReference(Kernel::Counted<IndexTopic const> const & other);

    /// Counts changes of GUIDs and of names and parents in the whole process: a look-up table made before the number
    /// moved is out of date.
    [[nodiscard]] static std::uint64_t GetGUIDVersion();
    [[nodiscard]] static std::uint64_t GetNameVersion();

private:
    friend class Index;

    void SetCrossReferences(CrossReferences references);

    mutable std::mutex m_Lock;
    String m_Name;
    String m_GUID;
    String m_SortString;
    Kernel::Counted<IndexTopic const> m_Parent;
    CrossReferences m_CrossReferences;
};

}
