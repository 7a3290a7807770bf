#include "framework/document/CloseDocumentCommand.h"

#include "framework/document/CloseDocumentNotification.h"
#include "framework/document/DocumentCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/document/DocumentRegistry.h"
#include "framework/document/DocumentSaveResult.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Activity.h"
#include "framework/kernel/CommandCoverage.h"
#include "framework/kernel/Scheduler.h"

#include <utility>

using Kernel::Counted;

namespace
{

using Callbacks = std::vector<std::function<void()>>;

/// A turn of the document's queue that is part of closing it.
class ClosingTurn : public DocumentCommand
{
public:
    Kernel::LocalisedString GetDescription() const override
    {
        return Kernel::LocalisedString("Close document", "Command description");
    }
    void Undo() override {}
    void Notify(std::vector<Counted<Kernel::Notification>> &) override {}
    bool ShouldStackForUndo() const override { return false; }
};

}

/// What a close does, on the turns that it takes. Keeps the document's path, which the close callbacks want.
class CloseDocumentTurn
{
public:
    /// The document has been taken out of everybody's hands: closes its file as the queue's last turn.
    static void EnqueueLast(Counted<DocumentController> const & document, Counted<ApplicationTerminator> terminator,
                            Counted<CloseDocumentNotification> notification, Callbacks callbacks);
    /// A close that comes second: its end is that of the first.
    static void Follow(Counted<DocumentController> const & document, Callbacks callbacks);
    static void EnqueueLeaving(Counted<DocumentController> const & document, Counted<ApplicationTerminator> terminator,
                               bool saveFirst, bool closeUnsaved, Callbacks callbacks);

    [[nodiscard]] static DocumentRegistry & Registry() { return *VantraController::GetInstance().m_Registry; }
};

namespace
{

/// The queue's last turn.
class LastTurn final : public ClosingTurn
{
public:
    LastTurn(Counted<ApplicationTerminator> terminator, Counted<CloseDocumentNotification> notification)
        : m_Terminator(std::move(terminator)),
          m_Notification(std::move(notification))
    {
    }

    void Do() override
    {
        String const path = GetDocument()->GetPath();
        GetDocument()->ShutDownArchive();
        CloseDocumentTurn::Registry().Closed(*GetDocument());
        if (m_Notification) {
            m_Notification->Closed(path);
        }
        if (m_Terminator) {
            Counted<DocumentController const> const document(GetDocument().Get());
            AddCompletionCallbacks(
                {[terminator = m_Terminator, document] { terminator->OnDocumentClose(document, true); }});
        }
    }

private:
    Counted<ApplicationTerminator> const m_Terminator;
    Counted<CloseDocumentNotification> const m_Notification;
};

/// The user lets go of a document: saved if wanted, then out of the front, and closed if nobody else has it.
class LeavingTurn final : public ClosingTurn
{
public:
    LeavingTurn(Counted<ApplicationTerminator> terminator, bool saveFirst, bool closeUnsaved)
        : m_Terminator(std::move(terminator)),
          m_SaveFirst(saveFirst),
          m_CloseUnsaved(closeUnsaved)
    {
    }

    void Do() override
    {
        DocumentController & document = *GetDocument();
        Counted<DocumentController> const counted(&document);
        if (m_SaveFirst && document.IsDirty()) {
            DocumentSaveResult result;
            document.SaveDocument(result, document.GetPath());
            VantraController::GetInstance().Broadcast(Kernel::MakeCounted<DocumentSaveNotification>(counted, result));
            if (!result.IsSuccess() && !m_CloseUnsaved) {
                Tell(false);
                return;
            }
        }
        switch (CloseDocumentTurn::Registry().Leave(document, !m_SaveFirst && document.IsDirty())) {
        case DocumentRegistry::Leaving::Closing: {
            auto const notification = Kernel::MakeCounted<CloseDocumentNotification>(counted);
            VantraController::GetInstance().Broadcast(notification);
            CloseDocumentTurn::EnqueueLast(counted, m_Terminator, notification, TakeCompletionCallbacks());
            break;
        }
        case DocumentRegistry::Leaving::Demoted: {
            auto const notification = Kernel::MakeCounted<CloseDocumentNotification>(counted);
            VantraController::GetInstance().Broadcast(notification);
            document.SetWantNotifications(false);
            document.SetWantBackgroundTasks(false);
            document.EngageBookLock(false);
            static_cast<void>(document.HoldFile(false));
            notification->Closed(document.GetPath());
            Tell(true);
            break;
        }
        case DocumentRegistry::Leaving::AlreadyClosing:
            CloseDocumentTurn::EnqueueLast(counted, m_Terminator, nullptr, TakeCompletionCallbacks());
            break;
        case DocumentRegistry::Leaving::NotOurs:
            Tell(true);
            break;
        }
    }

private:
    void Tell(bool closed)
    {
        if (m_Terminator) {
            Counted<DocumentController const> const document(GetDocument().Get());
            AddCompletionCallbacks(
                {[terminator = m_Terminator, document, closed] { terminator->OnDocumentClose(document, closed); }});
        }
    }

    Counted<ApplicationTerminator> const m_Terminator;
    bool const m_SaveFirst;
    bool const m_CloseUnsaved;
};

}

void CloseDocumentTurn::EnqueueLast(Counted<DocumentController> const & document,
                                    Counted<ApplicationTerminator> terminator,
                                    Counted<CloseDocumentNotification> notification, Callbacks callbacks)
{
    auto const turn = Kernel::MakeCounted<LastTurn>(std::move(terminator), std::move(notification));
    turn->AddCompletionCallbacks(std::move(callbacks));
    if (document->EnqueueLastCommand(turn)) {
        Registry().LastTurnIsWaiting();
    } else {
        Follow(document, turn->TakeCompletionCallbacks());
    }
}

void CloseDocumentTurn::Follow(Counted<DocumentController> const & document, Callbacks callbacks)
{
    Kernel::Activity::Begin();
    Kernel::Scheduler::Run([document, run = std::move(callbacks)] {
        document->WaitUntilCommandQueueEmpty();
        for (std::function<void()> const & callback : run) {
            callback();
        }
        Kernel::Activity::End();
    });
}

void CloseDocumentTurn::EnqueueLeaving(Counted<DocumentController> const & document,
                                       Counted<ApplicationTerminator> terminator, bool saveFirst, bool closeUnsaved,
                                       Callbacks callbacks)
{
    auto const turn = Kernel::MakeCounted<LeavingTurn>(std::move(terminator), saveFirst, closeUnsaved);
    turn->AddCompletionCallbacks(std::move(callbacks));
    if (!document->EnqueueCommand(turn)) {
        Follow(document, turn->TakeCompletionCallbacks());
    }
}

CloseDocumentCommand::CloseDocumentCommand(Counted<DocumentController const> document,
                                           Counted<ApplicationTerminator> terminator, bool saveFirst, bool closeUnsaved)
    : m_Document(std::move(document)),
      m_Terminator(std::move(terminator)),
      m_SaveFirst(saveFirst),
      m_CloseUnsaved(closeUnsaved)
{
}

CloseDocumentCommand::~CloseDocumentCommand() = default;

Kernel::LocalisedString CloseDocumentCommand::GetDescription() const
{
    return Kernel::LocalisedString("Close document", "Command description");
}

void CloseDocumentCommand::Do()
{
    Counted<DocumentController> const document =
        VantraController::GetInstance().GetMutableDocumentController(m_Document);
    if (!document) {
        return;
    }
    // The completion follows the document's own turn: this queue waits for nobody.
    Callbacks callbacks = TakeCompletionCallbacks();
    if (VantraController::GetInstance().IsActiveDocumentController(m_Document)) {
        CloseDocumentTurn::EnqueueLeaving(document, m_Terminator, m_SaveFirst, m_CloseUnsaved, std::move(callbacks));
        return;
    }
    switch (CloseDocumentTurn::Registry().Leave(*document, true)) {
    case DocumentRegistry::Leaving::Closing:
    case DocumentRegistry::Leaving::AlreadyClosing:
        CloseDocumentTurn::EnqueueLast(document, m_Terminator, nullptr, std::move(callbacks));
        break;
    case DocumentRegistry::Leaving::Demoted:
    case DocumentRegistry::Leaving::NotOurs:
        AddCompletionCallbacks(std::move(callbacks));
        break;
    }
}

void CloseDocumentCommand::Notify(std::vector<Counted<Kernel::Notification>> &) {}
