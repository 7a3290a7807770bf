// The book's master index and its agreement with the topic trees of the chapters. A topic is one thing in all chapters
// by its GUID; its full name finds its counterpart while it has none. The master wins.

#include "core/BookChapter.h"
#include "core/BookController.h"
#include "framework/commands/IndexTopicCommands.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/VantraController.h"
#include "framework/story/Index.h"

#include <map>

namespace Book
{

namespace
{

using Topic = Kernel::Counted<Story::IndexTopic const>;

void Run(Kernel::Counted<DocumentCommand> command, Kernel::Counted<DocumentController const> const & document)
{
    VantraController::GetInstance().EnqueueCommandAndWait(std::move(command), document, false);
}

/// Topics of an index as they stand now: the commands that follow change the list under an iteration.
std::vector<Topic> TopicsOf(Story::Index const & index)
{
    std::vector<Topic> topics;
    for (Kernel::JailCounted<Story::IndexTopic> const & topic : index) {
        topics.push_back(topic);
    }
    return topics;
}

}

void BookController::SetMasterIndex(Kernel::Counted<Story::Index const> index)
{
    m_MasterIndex.Set(index->CloneAddingGUIDS());
    Snapshot<ChapterList> const chapters = Chapters();
    for (Kernel::Counted<BookChapter> const & chapter : chapters) {
        if (!chapter) {
            continue;
        }
        Kernel::Counted<DocumentController> const document =
            VantraController::GetInstance().GetRegisteredDocumentControllerFromPath(chapter->GetPath());
        // The document that the change came from has it already.
        if (document && document->GetDocument()->GetIndex().Get() != index.Get()) {
            ReconcileIndex(document);
        }
    }
    MarkChanged();
}

void BookController::ReconcileIndex(Kernel::Counted<DocumentController const> document)
{
    SetInIndexUpdate(true);
    Kernel::Counted<Story::Index const> const docIndex = document->GetDocument()->GetIndex();
    if (!GetMasterIndex()) {
        m_MasterIndex.Set(docIndex->CloneAddingGUIDS());
    }
    bool const hadGuids = docIndex->TopicsContainGUIDs();
    MapIndexGUIDs(document, docIndex);
    AddMissingTopics(document, docIndex);
    // A document none of whose topics had a GUID keeps its names and its tree on this pass.
    if (hadGuids) {
        SynchronizeIndexStructure(document, docIndex);
    }
    SetInIndexUpdate(false);

    if (!AdoptOrphanTopics(document, docIndex)) {
        return;
    }
    Snapshot<ChapterList> const chapters = Chapters();
    for (Kernel::Counted<BookChapter> const & chapter : chapters) {
        if (!chapter) {
            continue;
        }
        if (Kernel::Counted<DocumentController> const open =
                VantraController::GetInstance().GetRegisteredDocumentControllerFromPath(chapter->GetPath())) {
            ReconcileIndex(open);
        }
    }
}

void BookController::MapIndexGUIDs(Kernel::Counted<DocumentController const> document,
                                   Kernel::Counted<Story::Index const> docIndex)
{
    Kernel::Counted<Story::Index const> const master = GetMasterIndex();
    for (Topic const & topic : TopicsOf(*docIndex)) {
        if (topic->HasGUID()) {
            continue;
        }
        if (Topic const found = master->FindTopicByName(topic->GetNameWithParents(), false)) {
            Run(Kernel::MakeCounted<Commands::SetIndexTopicGUIDCommand>(topic, found->GetGUID()), document);
        }
    }
}

void BookController::AddMissingTopics(Kernel::Counted<DocumentController const> document,
                                      Kernel::Counted<Story::Index const> docIndex)
{
    std::vector<Kernel::Counted<Story::IndexTopic>> newTopics;
    std::map<String, Topic> matched;
    for (Topic const & topic : TopicsOf(*GetMasterIndex())) {
        if (docIndex->FindTopicByGUID(topic->GetGUID())) {
            continue;
        }
        Topic parent;
        if (Topic const masterParent = topic->GetParent()) {
            parent = docIndex->FindTopicByGUID(masterParent->GetGUID());
            if (!parent) {
                auto const entry = matched.find(masterParent->GetGUID());
                if (entry == matched.end()) {
                    // Without its parent the topic has no place; the next reconciliation picks up what was left.
                    return;
                }
                parent = entry->second;
            }
        }
        if (Topic const same = docIndex->FindTopicByName(topic->GetNameWithParents(), false)) {
            Run(Kernel::MakeCounted<Commands::SetIndexTopicGUIDCommand>(same, topic->GetGUID()), document);
            matched[topic->GetGUID()] = same;
            continue;
        }
        auto const created = Kernel::MakeCounted<Story::IndexTopic>();
        created->SetName(topic->GetName());
        created->SetGUID(topic->GetGUID());
        created->SetSortString(topic->GetSortString());
        created->SetParent(parent);
        matched[topic->GetGUID()] = created;
        newTopics.push_back(created);
    }
    if (!newTopics.empty()) {
        Run(Kernel::MakeCounted<AddIndexTopicCommand>(newTopics), document);
    }
}

void BookController::SynchronizeIndexStructure(Kernel::Counted<DocumentController const> document,
                                               Kernel::Counted<Story::Index const> docIndex)
{
    Kernel::Counted<Story::Index const> const master = GetMasterIndex();
    for (Topic const & topic : TopicsOf(*master)) {
        Topic const own = docIndex->FindTopicByGUID(topic->GetGUID());
        if (!own) {
            continue;
        }
        if (!Kernel::BaseCharTraits<char>::IsEqual(own->GetName(), topic->GetName())) {
            Run(Kernel::MakeCounted<Commands::RenameIndexTopicCommand>(own, topic->GetName()), document);
        }
        if (!Kernel::BaseCharTraits<char>::IsEqual(own->GetSortString(), topic->GetSortString())) {
            Run(Kernel::MakeCounted<Commands::SetIndexTopicSortCommand>(own, topic->GetSortString()), document);
        }

        Topic const masterParent = topic->GetParent();
        Topic const ownParent = own->GetParent();
        if (!masterParent && ownParent) {
            Run(Kernel::MakeCounted<Commands::ReparentIndexTopicCommand>(own, Topic()), document);
        } else if (masterParent && ownParent && !(masterParent->GetGUID() == ownParent->GetGUID())) {
            Run(Kernel::MakeCounted<Commands::ReparentIndexTopicCommand>(
                    own, docIndex->FindTopicByGUID(masterParent->GetGUID())),
                document);
        }

        for (Topic const & related : topic->GetCrossReferences()) {
            Topic const target = docIndex->FindTopicByGUID(related->GetGUID());
            if (target && !own->IsDirectlyRelatedTo(target)) {
                Run(Kernel::MakeCounted<Commands::AddIndexCrossReferenceCommand>(own, target), document);
            }
        }
        for (Topic const & related : own->GetCrossReferences()) {
            // A target that the master doesn't know is the chapter's own affair.
            Topic const target = master->FindTopicByGUID(related->GetGUID());
            if (target && !topic->IsDirectlyRelatedTo(target)) {
                Run(Kernel::MakeCounted<Commands::DeleteIndexCrossReferenceCommand>(own, related), document);
            }
        }
    }

    std::vector<Topic> unknown;
    for (Topic const & topic : TopicsOf(*docIndex)) {
        if (topic->HasGUID() && !master->FindTopicByGUID(topic->GetGUID())) {
            unknown.push_back(topic);
        }
    }
    if (!unknown.empty()) {
        Run(Kernel::MakeCounted<Commands::DeleteIndexTopicCommand>(unknown), document);
    }
}

bool BookController::AdoptOrphanTopics(Kernel::Counted<DocumentController const> document,
                                       Kernel::Counted<Story::Index const> docIndex)
{
    static_cast<void>(document);
    std::vector<Topic> orphans;
    for (Topic const & topic : TopicsOf(*docIndex)) {
        if (!topic->HasGUID()) {
            orphans.push_back(topic);
        }
    }
    if (orphans.empty()) {
        return false;
    }
    // Readers keep the master that they have; a copy with the new topics takes its place.
    Kernel::Counted<Story::Index> const master = GetMasterIndex()->CloneAddingGUIDS();
    bool changed = false;
    for (Topic const & orphan : orphans) {
        auto const adopted = Kernel::MakeCounted<Story::IndexTopic>();
        adopted->AssignNewGUID();
        adopted->SetName(orphan->GetName());
        adopted->SetSortString(orphan->GetSortString());
        if (Topic const parent = orphan->GetParent()) {
            adopted->SetParent(parent->HasGUID() ? master->FindTopicByGUID(parent->GetGUID())
                                                 : master->FindTopicByName(parent->GetNameWithParents(), false));
        }
        // A topic that can never come to its counterpart would otherwise grow the master at each reconciliation.
        if (!master->IsNameUsed(adopted->GetNameWithParents())) {
            changed |= master->AddTopic(adopted);
        }
    }
    if (changed) {
        m_MasterIndex.Set(master);
    }
    return changed;
}

}
