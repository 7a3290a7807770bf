#include "framework/document/DocumentNotifications.h"

#include "framework/document/Node.h"

#include <utility>

DocumentNotification::DocumentNotification(Kernel::Counted<DocumentController const> document)
    : m_Document(std::move(document))
{
}

DocumentNotification::~DocumentNotification() = default;

DocumentContentNotification::DocumentContentNotification(Kernel::Counted<DocumentController const> document,
                                                         bool layoutOnly)
    : DocumentNotification(std::move(document)), m_LayoutOnly(layoutOnly)
{
}

DocumentSaveNotification::DocumentSaveNotification(Kernel::Counted<DocumentController const> document,
                                                   DocumentSaveResult result)
    : DocumentNotification(std::move(document)), m_Result(std::move(result))
{
}

DocumentSaveNotification::~DocumentSaveNotification() = default;

DocumentSaveFailedNotification::DocumentSaveFailedNotification(Kernel::Counted<DocumentController const> document,
                                                               String path, String reason, String keptPath)
    : DocumentNotification(std::move(document)), m_Path(std::move(path)), m_Reason(std::move(reason)),
      m_KeptPath(std::move(keptPath))
{
}

DocumentCacheBitmapChangedNotification::DocumentCacheBitmapChangedNotification(
    Kernel::Counted<DocumentController const> document, Kernel::Counted<Node const> node)
    : DocumentNotification(std::move(document)), m_Node(std::move(node))
{
}

DocumentCacheBitmapChangedNotification::~DocumentCacheBitmapChangedNotification() = default;

CommandRefusedNotification::CommandRefusedNotification(Kernel::Counted<DocumentController const> document,
                                                       String description, String reason)
    : DocumentNotification(std::move(document)), m_Description(std::move(description)), m_Reason(std::move(reason))
{
}
