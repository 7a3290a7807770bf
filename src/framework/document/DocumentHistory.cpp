#include "framework/document/DocumentHistory.h"

DocumentHistory::~DocumentHistory()
{
    Clear();
}

void DocumentHistory::Add(Kernel::Counted<DomainCommand> command)
{
    for (Kernel::Counted<DomainCommand> const & undone : m_Redo) {
        undone->Teardown();
    }
    m_Redo.clear();
    m_Undo.push_back(std::move(command));
    if (MaximumSteps < m_Undo.size()) {
        m_Undo.front()->Teardown();
        m_Undo.pop_front();
    }
}

Kernel::Counted<DomainCommand> DocumentHistory::Undo()
{
    if (m_Undo.empty()) {
        return nullptr;
    }
    Kernel::Counted<DomainCommand> const command = m_Undo.back();
    command->UndoAndUpdateCaches();
    m_Undo.pop_back();
    m_Redo.push_back(command);
    return command;
}

Kernel::Counted<DomainCommand> DocumentHistory::Redo()
{
    if (m_Redo.empty()) {
        return nullptr;
    }
    Kernel::Counted<DomainCommand> const command = m_Redo.back();
    command->RedoAndUpdateCaches();
    m_Redo.pop_back();
    m_Undo.push_back(command);
    return command;
}

void DocumentHistory::Clear()
{
    for (Kernel::Counted<DomainCommand> const & command : m_Undo) {
        command->Teardown();
    }
    for (Kernel::Counted<DomainCommand> const & command : m_Redo) {
        command->Teardown();
    }
    m_Undo.clear();
    m_Redo.clear();
}
