#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/Notification.h"

class DocumentController;

/// Base of what an open document tells the other layers and the front end.
class DocumentNotification : public Kernel::Notification
{
public:
    [[nodiscard]] Kernel::Counted<DocumentController const> const & GetDocumentController() const { return m_Document; }

protected:
    explicit DocumentNotification(Kernel::Counted<DocumentController const> document);
    ~DocumentNotification() override;

private:
    Kernel::Counted<DocumentController const> const m_Document;
};

/// Base of those that a change of content raises, and composing as well.
class DocumentContentNotification : public DocumentNotification
{
public:
    /// Only where things lie has changed, not what they are: composing sets it, and nobody has to compose again for it.
    [[nodiscard]] bool IsLayoutOnly() const { return m_LayoutOnly; }

protected:
    DocumentContentNotification(Kernel::Counted<DocumentController const> document, bool layoutOnly);

private:
    bool const m_LayoutOnly;
};
