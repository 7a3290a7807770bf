#include "commands/BookCommand.h"

namespace Book
{

Kernel::ClassProperties const BookCommand::ms_ClassProperties(Kernel::ClassUID("BkCm"), nullptr, 0, {}, nullptr);
static Kernel::ClassPropertiesBase::Init const s_BookCommandInit(BookCommand::GetTypeClassProperties());

Kernel::Counted<const DomainController> BookCommand::GetDomainController() const
{
    return GetBookController();
}

Kernel::Counted<DomainController> BookCommand::GetDomainController()
{
    return GetBookController();
}

void BookCommand::PostDequeueWithMutableDomainController(Kernel::NonCounted<DomainController> controller)
{
    m_BookController = dynamic_cast<BookController *>(controller.Get());
}

void BookCommand::PostLoad(Kernel::NonCounted<BookController> book)
{
    m_BookController = book.Get();
}

void BookCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> &) {}

void BookCommand::Save(Kernel::OutSerialiser &) const {}

bool BookCommand::Load(Kernel::InSerialiser const &, Kernel::FileStore &, unsigned short)
{
    return true;
}

Kernel::Counted<BookController> BookCommand::GetBookController()
{
    return Kernel::Counted<BookController>(m_BookController);
}

Kernel::Counted<BookController const> BookCommand::GetBookController() const
{
    return Kernel::Counted<BookController const>(m_BookController);
}

Kernel::ClassProperties const & BookCommand::GetObjectClassProperties() const
{
    return ms_ClassProperties;
}

Kernel::ClassProperties const & BookCommand::GetTypeClassProperties()
{
    return ms_ClassProperties;
}

}
