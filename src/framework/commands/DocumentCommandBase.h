#pragma once

#include "framework/document/DocumentCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/kernel/CommandCoverage.h"

/// A static object of this class enters a command class in the list of all command classes.
class CommandRegistration
{
public:
    CommandRegistration(std::type_info const & type, char const * name)
    {
        CommandCoverage::Instance().Register(type, name);
    }
};

/// What the commands that change a document share: undo by putting back what stood there, and what they tell of it.
///
/// A command throws `CommandException` for what it can't do, before it changes anything; the queue tells the user.
class UndoableDocumentCommand : public DocumentCommand
{
public:
    void Redo() override { Do(); }

protected:
    /// The document that it runs on, as notifications carry it.
    [[nodiscard]] Kernel::Counted<DocumentController const> Self() const
    {
        return Kernel::Counted<DocumentController const>(GetDocument().Get());
    }
    [[nodiscard]] DocumentNode & Tree() const { return *GetDocument()->GetDocument(); }
};

/// A command that is no change of the user's: it leaves the history alone and the document clean.
class PassingDocumentCommand : public DocumentCommand
{
public:
    void Undo() override {}
    void Redo() override {}
    [[nodiscard]] bool ShouldStackForUndo() const override { return false; }
    [[nodiscard]] bool ClearsPreviewCommands() const override { return false; }

protected:
    [[nodiscard]] Kernel::Counted<DocumentController const> Self() const
    {
        return Kernel::Counted<DocumentController const>(GetDocument().Get());
    }
};
