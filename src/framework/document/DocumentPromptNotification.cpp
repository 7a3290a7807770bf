#include "framework/document/DocumentPromptNotification.h"

#include "framework/kernel/DomainController.h"

#include <utility>

namespace
{

/// An answer is given by the controller's own turn, which may change it; who asks only names it.
Kernel::Counted<DomainController> Mutable(Kernel::Counted<DomainController const> const & controller)
{
    return const_cast<DomainController *>(controller.Get());
}

}

DocumentPromptNotification::DocumentPromptNotification(String title, String message, DocumentPromptChoice choices,
                                                       DocumentPromptIcon icon, std::vector<String> const & labels,
                                                       std::function<void(DocumentPromptChoice)> callback,
                                                       Kernel::Counted<DomainController const> controller)
    : m_Title(std::move(title)), m_Message(std::move(message)), m_Choices(choices), m_Icon(icon), m_Labels(labels),
      m_Callback(std::move(callback)), m_Controller(std::move(controller)),
      m_Question(Mutable(m_Controller), [call = m_Callback, choices] {
          call((choices & PromptCancel) != 0 ? PromptCancel : PromptNothing);
      })
{
    TellWhenPassed();
}

DocumentPromptNotification::~DocumentPromptNotification() = default;

bool DocumentPromptNotification::Answer(DocumentPromptChoice choice) const
{
    return m_Question.Answer([call = m_Callback, choice] { call(choice); });
}

void DocumentPromptNotification::OnPassedEveryLine()
{
    if (IsKept()) {
        m_Question.MarkAsked();
    }
}
