#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/Notification.h"
#include "framework/kernel/Question.h"
#include "framework/kernel/StringT.h"

#include <functional>
#include <vector>

class DomainController;

/// A set of answers; a mask of several offers them all.
enum DocumentPromptChoice : unsigned int
{
    PromptNothing = 0,
    PromptOk = 1,
    PromptCancel = 2,
    PromptYes = 4,
    PromptNo = 8
};

enum DocumentPromptIcon
{
    PromptIconNone = 0,
    PromptIconQuestion = 1,
    PromptIconWarning = 2,
    PromptIconError = 3
};

/// A question with a few answers. The front end keeps the notification while it asks, then calls `Answer`.
class DocumentPromptNotification : public Kernel::Notification
{
public:
    /// \param title, message, labels in the user's language; a label replaces a choice's usual word, in the order of the
    ///        choices' bits, and an empty list leaves them all
    /// \param callback called exactly once, as a turn of the controller's queue under its writer lock; with
    ///        `PromptCancel`, or `PromptNothing` where that is not offered, if nobody answers
    /// \param controller whom the question concerns
    DocumentPromptNotification(String title, String message, DocumentPromptChoice choices, DocumentPromptIcon icon,
                               std::vector<String> const & labels, std::function<void(DocumentPromptChoice)> callback,
                               Kernel::Counted<DomainController const> controller);

    [[nodiscard]] String const & GetTitle() const { return m_Title; }
    [[nodiscard]] String const & GetMessage() const { return m_Message; }
    [[nodiscard]] DocumentPromptChoice GetChoices() const { return m_Choices; }
    [[nodiscard]] DocumentPromptIcon GetIcon() const { return m_Icon; }
    [[nodiscard]] std::vector<String> const & GetLabels() const { return m_Labels; }
    [[nodiscard]] Kernel::Counted<DomainController const> const & GetDomainController() const { return m_Controller; }

    /// The user's choice. Safe on any thread; false if the question was answered before.
    bool Answer(DocumentPromptChoice choice) const;

    [[nodiscard]] bool MustProcessWithoutBookLock() const override { return true; }

protected:
    ~DocumentPromptNotification() override;
    void OnPassedEveryLine() override;

private:
    String const m_Title;
    String const m_Message;
    DocumentPromptChoice const m_Choices;
    DocumentPromptIcon const m_Icon;
    std::vector<String> const m_Labels;
    std::function<void(DocumentPromptChoice)> const m_Callback;
    Kernel::Counted<DomainController const> const m_Controller;
    Kernel::Question m_Question;
};
