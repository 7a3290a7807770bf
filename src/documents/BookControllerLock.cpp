#include "core/BookController.h"
#include "documents/BookLockCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/document/VantraController.h"

namespace Book
{

void BookController::EngageBookLock(bool engage)
{
    VantraController & application = VantraController::GetInstance();
    for (Kernel::Counted<BookChapter> const & chapter : Chapters()) {
        if (!chapter) {
            continue;
        }
        if (auto const document = application.GetRegisteredDocumentControllerFromPath(chapter->GetPath())) {
            application.EnqueueCommandAndWait(Kernel::MakeCounted<BookLockCommand>(engage), document, false);
        }
    }
}

}
