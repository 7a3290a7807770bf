#pragma once

#include "framework/commands/DocumentCommandBase.h"

/// Lays another colour format over the document for output. It is no change of the document: nothing of it is saved,
/// edits that come later go beneath it, and the next `UndoCommand` takes it off and nothing else.
class ConvertFormatOrProfileCommand : public PassingDocumentCommand
{
public:
    ConvertFormatOrProfileCommand(enum Raster::Format format, Raster::ICCManager::ICCProfileSet profiles)
        : m_Profiles(std::move(profiles)),
          m_Format(format)
    {
    }

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Undo() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> &) override {}

private:
    Raster::ICCManager::ICCProfileSet const m_Profiles;
    enum Raster::Format const m_Format;
};
