#pragma once

#include "framework/kernel/Serialisable.h"
#include "framework/story/IndexTopic.h"

#include <memory>
#include <unordered_map>

namespace Story
{

class ByteReader;
class ByteWriter;

/// The topics of a document's index, or of a book's master index, in list order.
///
/// The object keeps its identity for the document's life; its list is a snapshot that is swapped as a whole. So
/// `begin()` and `end()` walk the list as it was at `begin()`, whatever is added or removed meanwhile, and any thread
/// may read while one changes. Changes are made by one thread at a time, under the lock of the domain that owns it.
///
/// Cross-references lead only from and to topics of one index: removing a topic, and the end of the index, unties
/// them.
class Index : public virtual Kernel::Serialisable
{
public:
    using Topics = std::vector<Kernel::JailCounted<IndexTopic>>;

    /// Walks one snapshot, which it keeps alive.
    class Iterator
    {
    public:
        using value_type = Kernel::JailCounted<IndexTopic>;
        using difference_type = std::ptrdiff_t;

        Iterator() = default;
        explicit Iterator(std::shared_ptr<Topics const> topics) : m_Topics(std::move(topics)) {}

        value_type const & operator*() const { return (*m_Topics)[m_Index]; }
        value_type const * operator->() const { return &(*m_Topics)[m_Index]; }
        Iterator & operator++()
        {
            ++m_Index;
            return *this;
        }
        void operator++(int) { ++m_Index; }
        /// Only a comparison with `end()`, which every walk reaches at the end of its own snapshot, means something.
        friend bool operator==(Iterator const & a, Iterator const & b) { return a.IsAtEnd() == b.IsAtEnd(); }

    private:
        [[nodiscard]] bool IsAtEnd() const { return !m_Topics || m_Index >= m_Topics->size(); }

        std::shared_ptr<Topics const> m_Topics;
        std::size_t m_Index = 0;
    };

    /// Everything that the index holds at one moment, for undo. Keeps the topics, not their ties, alive.
    struct Content;

    Index();
    ~Index() override;
    Index(Index const &) = delete;
    Index & operator=(Index const &) = delete;

    [[nodiscard]] Iterator begin() const { return Iterator(GetTopics()); }
    [[nodiscard]] Iterator end() const { return {}; }
    [[nodiscard]] std::shared_ptr<Topics const> GetTopics() const;
    [[nodiscard]] std::size_t GetTopicCount() const { return GetTopics()->size(); }

    /// Null for an empty GUID and for one that no topic has. The first in list order, if several have it.
    [[nodiscard]] Kernel::Counted<IndexTopic const> FindTopicByGUID(String const & guid) const;
    /// By `IndexTopic::GetNameWithParents`; with `ignoreCase`, letters that differ only in case are the same.
    [[nodiscard]] Kernel::Counted<IndexTopic const> FindTopicByName(String const & nameWithParents,
                                                                   bool ignoreCase) const;
    /// The topic that is this very object, for changing; null if it has no place here.
    [[nodiscard]] Kernel::JailCounted<IndexTopic> GetMutableTopic(Kernel::Counted<IndexTopic const> const & topic) const;
    [[nodiscard]] bool TopicsContainGUIDs() const;
    /// Some topic has this full name.
    [[nodiscard]] bool IsNameUsed(String const & nameWithParents) const;

    /// Appends a topic. False, and nothing happens, if it is null, is here already, or has a GUID that is taken.
    bool AddTopic(Kernel::JailCounted<IndexTopic> topic);
    /// Takes out the topics; those below them move up to the nearest parent that stays.
    void RemoveTopics(std::vector<Kernel::Counted<IndexTopic const>> const & topics);
    /// The topic of this full name, made with its parents where they are missing.
    Kernel::JailCounted<IndexTopic> EnsureTopic(String const & nameWithParents);

    [[nodiscard]] std::shared_ptr<Content const> GetContent() const;
    void SetContent(std::shared_ptr<Content const> const & content);

    /// A deep copy in which every topic has a GUID: its own, or a new one.
    [[nodiscard]] Kernel::Counted<Index> CloneAddingGUIDS() const;

    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;
    void AccumulateHash(Kernel::HashAccumulator & hash) const override;
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;

    void SaveBytes(ByteWriter & out) const;
    [[nodiscard]] bool LoadBytes(ByteReader & in);

private:
    struct LookUp;

    void Publish(Topics topics);
    template <typename TText>
    std::shared_ptr<LookUp const> GetLookUp(std::shared_ptr<LookUp const> & kept, std::uint64_t version,
                                            TText const & textOf) const;

    mutable std::mutex m_Lock;
    std::shared_ptr<Topics const> m_Topics;
    mutable std::shared_ptr<LookUp const> m_ByGUID;
    mutable std::shared_ptr<LookUp const> m_ByName;
};

}
