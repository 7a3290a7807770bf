#include "documents/BookLockCommand.h"

#include "framework/document/DocumentController.h"

namespace Book
{

BookLockCommand::BookLockCommand(bool engage) : m_Engage(engage) {}

void BookLockCommand::Do()
{
    GetDocument()->EngageBookLock(m_Engage);
}

}
