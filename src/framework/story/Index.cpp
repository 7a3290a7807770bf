#include "framework/story/Index.h"

#include "framework/kernel/HashAccumulator.h"
#include "framework/story/ByteStream.h"

#include <algorithm>
#include <limits>
#include <unicode/unistr.h>
#include <unordered_set>

namespace Story
{

namespace
{

constexpr std::uint16_t FormatVersion = 1;
constexpr std::uint32_t NoTopic = std::numeric_limits<std::uint32_t>::max();

String FoldCase(String const & text)
{
    std::string folded;
    icu::UnicodeString::fromUTF8(icu::StringPiece(text.Data(), static_cast<int32_t>(text.Length())))
        .foldCase()
        .toUTF8String(folded);
    return folded;
}

/// Position of each topic in a list.
std::unordered_map<IndexTopic const *, std::uint32_t> NumberTopics(Index::Topics const & topics)
{
    std::unordered_map<IndexTopic const *, std::uint32_t> numbers;
    for (std::uint32_t i = 0; i < topics.size(); ++i) {
        numbers.emplace(topics[i].Get(), i);
    }
    return numbers;
}

std::uint32_t NumberOf(std::unordered_map<IndexTopic const *, std::uint32_t> const & numbers, IndexTopic const * topic)
{
    auto const place = numbers.find(topic);
    return place == numbers.end() ? NoTopic : place->second;
}

}

/// Finds topics by a text. Out of date when the list or the texts have changed.
struct Index::LookUp
{
    std::shared_ptr<Topics const> m_Topics;
    std::uint64_t m_Version = 0;
    std::unordered_map<String, Kernel::JailCounted<IndexTopic>> m_Map;
};

struct Index::Content
{
    struct Record
    {
        Kernel::JailCounted<IndexTopic> m_Topic;
        String m_Name;
        String m_GUID;
        String m_SortString;
        Kernel::Counted<IndexTopic const> m_Parent;
        IndexTopic::CrossReferences m_CrossReferences;
    };
    std::vector<Record> m_Records;
};

Index::Index() : m_Topics(std::make_shared<Topics const>()) {}

Index::~Index()
{
    // Topics that refer to each other would keep each other alive.
    for (auto const & topic : *m_Topics) {
        topic->SetCrossReferences({});
    }
}

std::shared_ptr<Index::Topics const> Index::GetTopics() const
{
    std::lock_guard const lock(m_Lock);
    return m_Topics;
}

void Index::Publish(Topics topics)
{
    auto published = std::make_shared<Topics const>(std::move(topics));
    std::lock_guard const lock(m_Lock);
    m_Topics.swap(published);
}

template <typename TText>
std::shared_ptr<Index::LookUp const> Index::GetLookUp(std::shared_ptr<LookUp const> & kept, std::uint64_t version,
                                                      TText const & textOf) const
{
    auto const topics = GetTopics();
    {
        std::lock_guard const lock(m_Lock);
        if (kept && kept->m_Topics == topics && kept->m_Version == version) {
            return kept;
        }
    }
    // The version was read before the texts: a change in between makes the next caller look again.
    auto made = std::make_shared<LookUp>();
    made->m_Topics = topics;
    made->m_Version = version;
    made->m_Map.reserve(topics->size());
    for (auto const & topic : *topics) {
        if (auto text = textOf(*topic); !text.Empty()) {
            made->m_Map.try_emplace(std::move(text), topic);
        }
    }
    std::lock_guard const lock(m_Lock);
    kept = made;
    return made;
}

Kernel::Counted<IndexTopic const> Index::FindTopicByGUID(String const & guid) const
{
    auto const lookUp = GetLookUp(m_ByGUID, IndexTopic::GetGUIDVersion(),
                                  [](IndexTopic const & topic) { return topic.GetGUID(); });
    auto const place = lookUp->m_Map.find(guid);
    return place == lookUp->m_Map.end() ? nullptr : place->second;
}

Kernel::Counted<IndexTopic const> Index::FindTopicByName(String const & nameWithParents, bool ignoreCase) const
{
    if (!ignoreCase) {
        auto const lookUp = GetLookUp(m_ByName, IndexTopic::GetNameVersion(),
                                      [](IndexTopic const & topic) { return topic.GetNameWithParents(); });
        auto const place = lookUp->m_Map.find(nameWithParents);
        return place == lookUp->m_Map.end() ? nullptr : place->second;
    }
    String const folded = FoldCase(nameWithParents);
    for (auto const & topic : *this) {
        if (FoldCase(topic->GetNameWithParents()) == folded) {
            return topic;
        }
    }
    return nullptr;
}

Kernel::JailCounted<IndexTopic> Index::GetMutableTopic(Kernel::Counted<IndexTopic const> const & topic) const
{
    auto const topics = GetTopics();
    auto const place = std::find(topics->begin(), topics->end(), topic);
    return place == topics->end() ? nullptr : *place;
}

bool Index::TopicsContainGUIDs() const
{
    auto const topics = GetTopics();
    return std::any_of(topics->begin(), topics->end(), [](auto const & topic) { return topic->HasGUID(); });
}

bool Index::IsNameUsed(String const & nameWithParents) const
{
    return static_cast<bool>(FindTopicByName(nameWithParents, false));
}

bool Index::AddTopic(Kernel::JailCounted<IndexTopic> topic)
{
    if (!topic || GetMutableTopic(topic) || FindTopicByGUID(topic->GetGUID())) {
        return false;
    }
    Topics topics = *GetTopics();
    topics.push_back(std::move(topic));
    Publish(std::move(topics));
    return true;
}

void Index::RemoveTopics(std::vector<Kernel::Counted<IndexTopic const>> const & topics)
{
    std::unordered_set<IndexTopic const *> removed;
    for (auto const & topic : topics) {
        removed.insert(topic.Get());
    }
    Topics kept;
    Topics gone;
    for (auto const & topic : *this) {
        (removed.contains(topic.Get()) ? gone : kept).push_back(topic);
    }
    for (auto const & topic : kept) {
        auto parent = topic->GetParent();
        bool const moves = parent && removed.contains(parent.Get());
        while (parent && removed.contains(parent.Get())) {
            parent = parent->GetParent();
        }
        if (moves) {
            topic->SetParent(parent);
        }
        for (auto const & other : topic->GetCrossReferences()) {
            if (removed.contains(other.Get())) {
                topic->RemoveCrossReference(other);
            }
        }
    }
    Publish(std::move(kept));
    for (auto const & topic : gone) {
        topic->SetCrossReferences({});
    }
}

Kernel::JailCounted<IndexTopic> Index::EnsureTopic(String const & nameWithParents)
{
    if (auto const found = FindTopicByName(nameWithParents, false)) {
        return GetMutableTopic(found);
    }
    auto const whole = nameWithParents.View();
    auto const separator = whole.rfind(IndexTopic::NameSeparator);
    auto topic = Kernel::MakeCounted<IndexTopic>();
    if (separator == std::string_view::npos) {
        topic->SetName(nameWithParents);
    } else {
        topic->SetName(String(whole.substr(separator + 1)));
        if (separator > 0) {
            topic->SetParent(EnsureTopic(String(whole.substr(0, separator))));
        }
    }
    AddTopic(topic);
    return topic;
}

std::shared_ptr<Index::Content const> Index::GetContent() const
{
    auto content = std::make_shared<Content>();
    for (auto const & topic : *this) {
        content->m_Records.push_back({topic, topic->GetName(), topic->GetGUID(), topic->GetSortString(),
                                      topic->GetParent(), topic->GetCrossReferences()});
    }
    return content;
}

void Index::SetContent(std::shared_ptr<Content const> const & content)
{
    std::unordered_set<IndexTopic const *> kept;
    Topics topics;
    for (Content::Record const & record : content->m_Records) {
        kept.insert(record.m_Topic.Get());
        topics.push_back(record.m_Topic);
    }
    auto const before = GetTopics();
    // All parents go first, since an order in between could look like a ring, which SetParent refuses.
    for (auto const & record : content->m_Records) {
        record.m_Topic->SetParent(nullptr);
    }
    for (auto const & record : content->m_Records) {
        record.m_Topic->SetName(record.m_Name);
        record.m_Topic->SetGUID(record.m_GUID);
        record.m_Topic->SetSortString(record.m_SortString);
        record.m_Topic->SetParent(record.m_Parent);
        record.m_Topic->SetCrossReferences(record.m_CrossReferences);
    }
    Publish(std::move(topics));
    for (auto const & topic : *before) {
        if (!kept.contains(topic.Get())) {
            topic->SetCrossReferences({});
        }
    }
}

Kernel::Counted<Index> Index::CloneAddingGUIDS() const
{
    auto const source = GetTopics();
    auto const numbers = NumberTopics(*source);
    Topics copies;
    for (auto const & topic : *source) {
        auto copy = Kernel::MakeCounted<IndexTopic>();
        copy->m_Name = topic->GetName();
        copy->m_GUID = topic->GetGUID();
        copy->m_SortString = topic->GetSortString();
        copies.push_back(copy);
    }
    for (std::size_t i = 0; i < copies.size(); ++i) {
        if (!copies[i]->HasGUID()) {
            copies[i]->AssignNewGUID();
        }
        if (auto const parent = NumberOf(numbers, (*source)[i]->GetParent().Get()); parent != NoTopic) {
            copies[i]->SetParent(copies[parent]);
        }
        for (auto const & other : (*source)[i]->GetCrossReferences()) {
            if (auto const number = NumberOf(numbers, other.Get()); number != NoTopic) {
                copies[i]->AddCrossReference(copies[number]);
            }
        }
    }
    auto clone = Kernel::MakeCounted<Index>();
    clone->Publish(std::move(copies));
    return clone;
}

void Index::SaveBytes(ByteWriter & out) const
{
    auto const topics = GetTopics();
    auto const numbers = NumberTopics(*topics);
    out.Write(FormatVersion);
    out.Write(static_cast<std::uint32_t>(topics->size()));
    for (auto const & topic : *topics) {
        out.WriteString(topic->GetName());
        out.WriteString(topic->GetGUID());
        out.WriteString(topic->GetSortString());
        out.Write(NumberOf(numbers, topic->GetParent().Get()));
        auto const references = topic->GetCrossReferences();
        out.Write(static_cast<std::uint32_t>(references.size()));
        for (auto const & other : references) {
            out.Write(NumberOf(numbers, other.Get()));
        }
    }
}

bool Index::LoadBytes(ByteReader & in)
{
    constexpr std::size_t leastTopic = 20;
    struct Ties
    {
        std::uint32_t m_Parent = NoTopic;
        std::vector<std::uint32_t> m_References;
    };
    if (in.Read<std::uint16_t>() != FormatVersion) {
        in.Fail();
    }
    auto const count = in.ReadCount(leastTopic);
    Topics topics;
    std::vector<Ties> ties;
    for (std::uint32_t i = 0; i < count && !in.HasFailed(); ++i) {
        auto topic = Kernel::MakeCounted<IndexTopic>();
        topic->m_Name = in.ReadString();
        topic->m_GUID = in.ReadString();
        topic->m_SortString = in.ReadString();
        topics.push_back(topic);
        Ties & tie = ties.emplace_back();
        tie.m_Parent = in.Read<std::uint32_t>();
        for (auto references = in.ReadCount(sizeof(std::uint32_t)); references > 0; --references) {
            tie.m_References.push_back(in.Read<std::uint32_t>());
        }
    }
    if (in.HasFailed()) {
        return false;
    }
    for (std::size_t i = 0; i < topics.size(); ++i) {
        if (ties[i].m_Parent < count) {
            topics[i]->SetParent(topics[ties[i].m_Parent]);
        }
        IndexTopic::CrossReferences references;
        std::unordered_set<std::uint32_t> seen;
        for (auto const number : ties[i].m_References) {
            if (number < count && number != i && seen.insert(number).second) {
                references.emplace_back(topics[number]);
            }
        }
        topics[i]->SetCrossReferences(std::move(references));
    }
    for (auto const & topic : *GetTopics()) {
        topic->SetCrossReferences({});
    }
    Publish(std::move(topics));
    return true;
}

void Index::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    ByteWriter bytes;
    SaveBytes(bytes);
    hash.AddBytes(bytes.GetBytes().data(), bytes.GetBytes().size());
}

}
