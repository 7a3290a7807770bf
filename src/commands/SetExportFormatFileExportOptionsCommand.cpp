#include "commands/SetExportFormatFileExportOptionsCommand.h"

#include "core/BookNotification.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(SetExportFormatFileExportOptionsCommand, "BSxF");

SetExportFormatFileExportOptionsCommand::SetExportFormatFileExportOptionsCommand() = default;

SetExportFormatFileExportOptionsCommand::SetExportFormatFileExportOptionsCommand(
    Kernel::Consolidated<Renderer::FileExportOptions> options)
    : m_Options(std::move(options))
{
}

Kernel::LocalisedString SetExportFormatFileExportOptionsCommand::GetDescription() const
{
    return Kernel::LocalisedString("Set Export Format Options", "Book Commands");
}

void SetExportFormatFileExportOptionsCommand::Do()
{
    GetBookController()->SetExportOptions(m_Options);
}

void SetExportFormatFileExportOptionsCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    Tell<BookChangedNotification>(notifications);
}

}
