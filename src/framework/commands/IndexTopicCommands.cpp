#include "framework/commands/IndexTopicCommands.h"

#include "framework/commands/CommandException.h"
#include "framework/story/SpecialGlyphs.h"

#include <map>

namespace
{

CommandRegistration const s_Add(typeid(AddIndexTopicCommand), "AddIndexTopicCommand");
CommandRegistration const s_Guid(typeid(Commands::SetIndexTopicGUIDCommand), "Commands::SetIndexTopicGUIDCommand");
CommandRegistration const s_Rename(typeid(Commands::RenameIndexTopicCommand), "Commands::RenameIndexTopicCommand");
CommandRegistration const s_Sort(typeid(Commands::SetIndexTopicSortCommand), "Commands::SetIndexTopicSortCommand");
CommandRegistration const s_Parent(typeid(Commands::ReparentIndexTopicCommand), "Commands::ReparentIndexTopicCommand");
CommandRegistration const s_AddReference(typeid(Commands::AddIndexCrossReferenceCommand),
                                         "Commands::AddIndexCrossReferenceCommand");
CommandRegistration const s_DeleteReference(typeid(Commands::DeleteIndexCrossReferenceCommand),
                                            "Commands::DeleteIndexCrossReferenceCommand");
CommandRegistration const s_Delete(typeid(Commands::DeleteIndexTopicCommand), "Commands::DeleteIndexTopicCommand");

}

void IndexTopicCommand::Do()
{
    Story::Index & index = *Tree().GetIndex();
    std::shared_ptr<Story::Index::Content const> before = index.GetContent();
    std::vector<std::pair<Kernel::Counted<Story::IndexTopic const>, String>> oldNames;
    for (Kernel::JailCounted<Story::IndexTopic> const & topic : index) {
        oldNames.emplace_back(topic, topic->GetNameWithParents());
    }
    Change(index);
    m_Before = std::move(before);
    RenameMarks(oldNames);
}

void IndexTopicCommand::Undo()
{
    Tree().GetIndex()->SetContent(m_Before);
    for (ChangedMark const & mark : m_ChangedMarks) {
        mark.m_Flow->GetStory()->ReplaceGlyph(mark.m_Offset, mark.m_Glyph);
        GetDocument()->SetTextDirty();
    }
}

void IndexTopicCommand::RenameMarks(
    std::vector<std::pair<Kernel::Counted<Story::IndexTopic const>, String>> const & oldNames)
{
    m_ChangedMarks.clear();
    std::map<String, String> renamed;
    for (auto const & [topic, oldName] : oldNames) {
        if (String const name = topic->GetNameWithParents(); name != oldName) {
            renamed.emplace(oldName, name);
        }
    }
    if (renamed.empty()) {
        return;
    }
    for (Kernel::Counted<TextFlow> const & flow : Tree().GetTextFlows()) {
        Story::Story & story = *flow->GetStory();
        for (std::size_t i = 0; i < story.GetObjects().size(); ++i) {
            Story::Story::Object const object = story.GetObjects()[i];
            auto const * const mark = dynamic_cast<Story::IndexMarkGlyph const *>(object.m_Glyph.Get());
            auto const found = mark ? renamed.find(mark->GetTopicNameWithParents()) : renamed.end();
            if (found != renamed.end()) {
                m_ChangedMarks.push_back({flow, object.m_Offset, object.m_Glyph});
                story.ReplaceGlyph(object.m_Offset, Kernel::MakeCounted<Story::IndexMarkGlyph>(found->second));
                GetDocument()->SetTextDirty();
            }
        }
    }
}

void IndexTopicCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    notifications.push_back(Kernel::MakeCounted<IndexTopicsChangedNotification>(Self()));
}

Kernel::JailCounted<Story::IndexTopic>
IndexTopicCommand::Require(Story::Index const & index, Kernel::Counted<Story::IndexTopic const> const & topic)
{
    Kernel::JailCounted<Story::IndexTopic> found = topic ? index.GetMutableTopic(topic) : nullptr;
    if (!found) {
        throw CommandException(
            Kernel::LocalisedString("The topic is not in the document's index any more.", "Index").ToString());
    }
    return found;
}

Kernel::LocalisedString AddIndexTopicCommand::GetDescription() const
{
    return Kernel::LocalisedString("Add index topics", "Document Command");
}

void AddIndexTopicCommand::Change(Story::Index & index)
{
    for (Kernel::Counted<Story::IndexTopic> const & topic : m_Topics) {
        index.AddTopic(topic);
    }
}

namespace Commands
{

Kernel::LocalisedString SetIndexTopicGUIDCommand::GetDescription() const
{
    return Kernel::LocalisedString("Identify index topic", "Document Command");
}

void SetIndexTopicGUIDCommand::Change(Story::Index & index)
{
    Require(index, m_Topic)->SetGUID(m_Text);
}

Kernel::LocalisedString RenameIndexTopicCommand::GetDescription() const
{
    return Kernel::LocalisedString("Rename index topic", "Document Command");
}

void RenameIndexTopicCommand::Change(Story::Index & index)
{
    Require(index, m_Topic)->SetName(m_Text);
}

Kernel::LocalisedString SetIndexTopicSortCommand::GetDescription() const
{
    return Kernel::LocalisedString("Sort index topic", "Document Command");
}

void SetIndexTopicSortCommand::Change(Story::Index & index)
{
    Require(index, m_Topic)->SetSortString(m_Text);
}

Kernel::LocalisedString ReparentIndexTopicCommand::GetDescription() const
{
    return Kernel::LocalisedString("Move index topic", "Document Command");
}

void ReparentIndexTopicCommand::Change(Story::Index & index)
{
    Kernel::JailCounted<Story::IndexTopic> const topic = Require(index, m_Topic);
    topic->SetParent(m_Other ? Kernel::Counted<Story::IndexTopic const>(Require(index, m_Other)) : nullptr);
}

Kernel::LocalisedString AddIndexCrossReferenceCommand::GetDescription() const
{
    return Kernel::LocalisedString("Add index cross-reference", "Document Command");
}

void AddIndexCrossReferenceCommand::Change(Story::Index & index)
{
    Require(index, m_Topic)->AddCrossReference(Require(index, m_Other));
}

Kernel::LocalisedString DeleteIndexCrossReferenceCommand::GetDescription() const
{
    return Kernel::LocalisedString("Delete index cross-reference", "Document Command");
}

void DeleteIndexCrossReferenceCommand::Change(Story::Index & index)
{
    Require(index, m_Topic)->RemoveCrossReference(m_Other);
}

Kernel::LocalisedString DeleteIndexTopicCommand::GetDescription() const
{
    return Kernel::LocalisedString("Delete index topics", "Document Command");
}

void DeleteIndexTopicCommand::Change(Story::Index & index)
{
    index.RemoveTopics(m_Topics);
}

}
