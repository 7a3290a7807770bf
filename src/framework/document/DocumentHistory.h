#pragma once

#include "framework/kernel/DomainCommand.h"

#include <deque>
#include <vector>

/// The commands of a document that can be undone, and those that can be done again. Under the document's writer lock.
class DocumentHistory
{
public:
    /// So many steps are kept; the oldest go.
    static constexpr std::size_t MaximumSteps = 100;

    ~DocumentHistory();

    /// A new step; what could be done again is gone.
    void Add(Kernel::Counted<DomainCommand> command);
    /// Takes the last step back, or does it again; the command, or null if there was none.
    Kernel::Counted<DomainCommand> Undo();
    Kernel::Counted<DomainCommand> Redo();
    void Clear();

    [[nodiscard]] std::size_t GetUndoCount() const { return m_Undo.size(); }
    [[nodiscard]] std::size_t GetRedoCount() const { return m_Redo.size(); }

private:
    std::deque<Kernel::Counted<DomainCommand>> m_Undo;
    std::vector<Kernel::Counted<DomainCommand>> m_Redo;
};
