#include "framework/document/RequestPdfPasswordsNotification.h"

#include "framework/document/DocumentController.h"
#include "framework/kernel/DataSource.h"

#include <utility>

RequestPdfPasswordsNotification::RequestPdfPasswordsNotification(Sources const & sources,
                                                                 Kernel::Counted<DocumentController const> document,
                                                                 std::function<void(Passwords const &)> answer)
    : DocumentNotification(document), m_Sources(sources), m_Answer(std::move(answer)),
      // The answer is given by the document's own turn, which may change it; who asks only names it.
      m_Question(Kernel::Counted<DomainController>(const_cast<DocumentController *>(document.Get())),
                 [call = m_Answer] { call(Passwords()); })
{
    TellWhenPassed();
}

RequestPdfPasswordsNotification::~RequestPdfPasswordsNotification() = default;

bool RequestPdfPasswordsNotification::Answer(Passwords const & passwords) const
{
    return m_Question.Answer([call = m_Answer, passwords] { call(passwords); });
}

void RequestPdfPasswordsNotification::OnPassedEveryLine()
{
    if (IsKept()) {
        m_Question.MarkAsked();
    }
}
