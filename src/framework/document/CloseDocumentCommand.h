#pragma once

#include "framework/document/ApplicationTerminator.h"
#include "framework/kernel/VantraCommand.h"

class DocumentController;

/// Closes a document. The application's queue only hands the close on: it runs as the last turn of the document's own
/// queue, behind all that was enqueued there, and the completion callback follows that turn.
///
/// For a document in front that a book still uses, the close takes it out of the user's hands and leaves it open.
/// Closing a document that is closed already completes at once.
class CloseDocumentCommand : public VantraCommand
{
public:
    /// \param terminator told how it went; may be null
    /// \param saveFirst changes are saved; without it they are lost
    /// \param closeUnsaved with `saveFirst`: close also if the save fails
    CloseDocumentCommand(Kernel::Counted<DocumentController const> document,
                         Kernel::Counted<ApplicationTerminator> terminator, bool saveFirst, bool closeUnsaved);
    ~CloseDocumentCommand() override;

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Undo() override {}
    void Redo() override {}
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    Kernel::Counted<DocumentController const> const m_Document;
    Kernel::Counted<ApplicationTerminator> const m_Terminator;
    bool const m_SaveFirst;
    bool const m_CloseUnsaved;
};
