#pragma once

#include "framework/commands/DocumentCommandBase.h"

/// Puts another set of bookmarks in place of the document's.
class SetPDFBookmarkManagerCommand : public UndoableDocumentCommand
{
public:
    explicit SetPDFBookmarkManagerCommand(Kernel::Counted<PDFBookmarkManager const> manager)
        : m_Manager(std::move(manager))
    {
    }

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Undo() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    Kernel::Counted<PDFBookmarkManager const> const m_Manager;
    Kernel::Counted<PDFBookmarkManager const> m_Before;
};
