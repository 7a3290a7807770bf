#pragma once

#include "commands/BookCommand.h"
#include "framework/render/FileExportOptions.h"

namespace Book
{

/// Sets the export options that the book keeps.
class SetExportFormatFileExportOptionsCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(SetExportFormatFileExportOptionsCommand);

public:
    explicit SetExportFormatFileExportOptionsCommand(Kernel::Consolidated<Renderer::FileExportOptions> options);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

protected:
    SetExportFormatFileExportOptionsCommand();

private:
    Kernel::Consolidated<Renderer::FileExportOptions> m_Options;
};

}
