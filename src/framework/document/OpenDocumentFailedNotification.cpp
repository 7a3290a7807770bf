#include "framework/document/OpenDocumentFailedNotification.h"

#include <utility>

OpenDocumentFailedNotification::OpenDocumentFailedNotification(String const & path, bool inFront)
    : m_Path(path), m_InFront(inFront)
{
}

OpenDocumentFailedNotification::~OpenDocumentFailedNotification() = default;

void OpenDocumentFailedNotification::SetResult(int result, String reason, String place)
{
    m_Result = result;
    m_Reason = std::move(reason);
    m_Place = std::move(place);
}
