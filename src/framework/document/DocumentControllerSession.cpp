#include "framework/document/DocumentControllerSession.h"

#include "framework/document/DocumentController.h"

DocumentControllerSession::DocumentControllerSession(Kernel::NonCounted<DocumentController const> document)
    : m_Document(document.Get())
{
    m_Document->AcquireReaderLock();
}

DocumentControllerSession::~DocumentControllerSession()
{
    m_Document->ReleaseReaderLock();
}
