#include "framework/document/DocumentCommand.h"

#include "framework/document/DocumentController.h"
#include "framework/document/Selection.h"

Kernel::ClassProperties const DocumentCommand::ms_ClassProperties(Kernel::ClassUID("DcCm"), nullptr, 0, {}, nullptr);
static Kernel::ClassPropertiesBase::Init const documentCommandInit(DocumentCommand::GetTypeClassProperties());

DocumentCommand::~DocumentCommand() = default;

Kernel::Counted<DomainController const> DocumentCommand::GetDomainController() const
{
    return Kernel::Counted<DocumentController const>(m_Document.Get());
}

Kernel::Counted<DomainController> DocumentCommand::GetDomainController()
{
    return Kernel::Counted<DocumentController>(m_Document.Get());
}

void DocumentCommand::PostDequeueWithMutableDomainController(Kernel::NonCounted<DomainController> controller)
{
    PostDequeueWithMutableController(dynamic_cast<DocumentController *>(controller.Get()));
}

void DocumentCommand::PostDequeueWithMutableController(Kernel::NonCounted<DocumentController> document)
{
    m_Document = document;
}

void DocumentCommand::PostLoad(Kernel::NonCounted<DocumentController> document)
{
    m_Document = document;
}

Kernel::Counted<Selection const> DocumentCommand::GetSelectionAfter() const
{
    return nullptr;
}

void DocumentCommand::Save(Kernel::OutSerialiser &) const {}

bool DocumentCommand::Load(Kernel::InSerialiser const &, Kernel::FileStore &, unsigned short)
{
    return true;
}

Kernel::ClassProperties const & DocumentCommand::GetObjectClassProperties() const
{
    return ms_ClassProperties;
}

Kernel::ClassProperties const & DocumentCommand::GetTypeClassProperties()
{
    return ms_ClassProperties;
}
