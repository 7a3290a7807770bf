#include "documents/BookLockCommand.h"

#include "framework/document/DocumentController.h"

namespace Book
{

Kernel::ClassProperties const BookLockCommand::ms_ClassProperties(Kernel::ClassUID("BLkC"),
                                                                  &BookLockCommand::CreateObject, 1, {},
                                                                  &DocumentCommand::GetTypeClassProperties());
static Kernel::ClassPropertiesBase::Init const s_BookLockCommandInit(BookLockCommand::GetTypeClassProperties());

BookLockCommand::BookLockCommand(bool engage) : m_Engage(engage) {}

void BookLockCommand::Do()
{
    GetDocument()->EngageBookLock(m_Engage);
}

Kernel::ClassProperties const & BookLockCommand::GetObjectClassProperties() const
{
    return ms_ClassProperties;
}

Kernel::ClassProperties const & BookLockCommand::GetTypeClassProperties()
{
    return ms_ClassProperties;
}

Kernel::Counted<Kernel::Serialisable> BookLockCommand::CreateObject()
{
    return Kernel::MakeCounted<BookLockCommand>(true);
}

}
