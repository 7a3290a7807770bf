#include "content/SetMasterIndexCommand.h"

#include "core/BookController.h"
#include "framework/story/Index.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(SetMasterIndexCommand, "SMIC");

SetMasterIndexCommand::SetMasterIndexCommand() = default;

SetMasterIndexCommand::SetMasterIndexCommand(Kernel::Counted<Story::Index const> index) : m_Index(std::move(index)) {}

Kernel::LocalisedString SetMasterIndexCommand::GetDescription() const
{
    return Kernel::LocalisedString("Update Index", "Book Command");
}

void SetMasterIndexCommand::Do()
{
    if (m_Index) {
        GetBookController()->SetMasterIndex(m_Index);
    }
}

}
