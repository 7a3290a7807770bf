#include "framework/commands/CompoundCommand.h"

#include "framework/commands/CommandException.h"

#include <algorithm>

namespace
{

CommandRegistration const s_Compound(typeid(CompoundCommand), "CompoundCommand");

}

CompoundCommand::CompoundCommand(bool stackForUndo, bool skipFailures, bool notifyTogether)
    : m_StackForUndo(stackForUndo),
      m_SkipFailures(skipFailures),
      m_NotifyTogether(notifyTogether)
{
}

CompoundCommand::~CompoundCommand() = default;

void CompoundCommand::Add(Kernel::Counted<DocumentCommand> command, Kernel::Counted<DocumentCommand const> after)
{
    KORVANE_ASSERT(command);
    auto const place = after ? std::find(m_Commands.begin(), m_Commands.end(), after) : m_Commands.end();
    m_Commands.insert(place == m_Commands.end() ? place : std::next(place), std::move(command));
}

Kernel::LocalisedString CompoundCommand::GetDescription() const
{
    return 1 == m_Commands.size() ? m_Commands.front()->GetDescription()
                                  : Kernel::LocalisedString("Several changes", "Document Command");
}

void CompoundCommand::PostDequeueWithMutableController(Kernel::NonCounted<DocumentController> document)
{
    UndoableDocumentCommand::PostDequeueWithMutableController(document);
    for (Kernel::Counted<DocumentCommand> const & command : m_Commands) {
        command->PostDequeueWithMutableController(document);
    }
}

void CompoundCommand::Do()
{
    m_Done.clear();
    m_Notifications.clear();
    for (Kernel::Counted<DocumentCommand> const & command : m_Commands) {
        try {
            command->DoAndUpdateCaches();
        } catch (CommandException const &) {
            if (m_SkipFailures) {
                continue;
            }
            Undo();
            throw;
        }
        m_Done.push_back(command);
        if (!m_NotifyTogether) {
            // What a command has to say is about the moment after it, not about the end of them all.
            command->NotifyWithCacheUpdates(m_Notifications);
        }
    }
}

void CompoundCommand::Undo()
{
    for (auto command = m_Done.rbegin(); command != m_Done.rend(); ++command) {
        (*command)->UndoAndUpdateCaches();
    }
    m_Notifications.clear();
}

void CompoundCommand::Redo()
{
    for (Kernel::Counted<DocumentCommand> const & command : m_Done) {
        command->RedoAndUpdateCaches();
    }
}

void CompoundCommand::Teardown()
{
    for (Kernel::Counted<DocumentCommand> const & command : m_Done) {
        command->Teardown();
    }
}

void CompoundCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    if (!m_Notifications.empty()) {
        notifications.insert(notifications.end(), m_Notifications.begin(), m_Notifications.end());
        m_Notifications.clear();
        return;
    }
    for (Kernel::Counted<DocumentCommand> const & command : m_Done) {
        command->NotifyWithCacheUpdates(notifications);
    }
}
