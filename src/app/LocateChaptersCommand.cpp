#include "app/LocateChaptersCommand.h"

#include "core/BookController.h"

namespace App
{

Kernel::LocalisedString LocateChaptersCommand::GetDescription() const
{
    return Kernel::LocalisedString("Locate chapters", "Book Commands");
}

void LocateChaptersCommand::Do()
{
    if (m_OldPath.Empty()) {
        GetBookController()->RespondMissingChapterPrompt(true);
    } else {
        GetBookController()->ResolveMissingChapters(m_OldPath, m_NewPath);
    }
}

}
