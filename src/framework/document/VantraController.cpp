#include "framework/document/VantraController.h"

#include "framework/document/ApplicationQueue.h"
#include "framework/document/BookSinkCollection.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/document/DocumentRegistry.h"
#include "framework/kernel/Assert.h"
#include "framework/kernel/BroadcastNotification.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/LocalisedString.h"
#include "framework/kernel/Semaphore.h"

#include <utility>

using Kernel::Counted;

namespace
{

/// Composes what a command left uncomposed in a document that has no background tasks of its own to do it.
class ComposeRestCommand final : public DocumentCommand
{
public:
    Kernel::LocalisedString GetDescription() const override { return {}; }
    void Do() override { m_Outcome = GetDocument()->ComposeText(false, nullptr); }
    void Undo() override {}
    void Notify(std::vector<Counted<Kernel::Notification>> & notifications) override
    {
        GetDocument()->AppendComposeNotifications(m_Outcome, notifications);
    }
    bool ShouldStackForUndo() const override { return false; }
    bool ClearsPreviewCommands() const override { return false; }

private:
    ComposeOutcome m_Outcome;
};

}

VantraController & VantraController::GetInstance()
{
    // Never destroyed: threads of the pool may outlive the program's static objects.
    static VantraController * const instance = new VantraController;
    return *instance;
}

VantraController::VantraController()
    : m_Registry(std::make_unique<DocumentRegistry>()),
      m_Queue(Kernel::MakeCounted<ApplicationQueue>()),
      m_UpViewResampler(Raster::ResamplerBicubic),
      m_DownViewResampler(Raster::ResamplerBilinear)
{
}

VantraController::~VantraController() = default;

void VantraController::Broadcast(Counted<Kernel::Notification> notification)
{
    BroadcastNotification::Post(std::move(notification));
}

void VantraController::EnqueueCommand(Counted<VantraCommand> command)
{
    if (dynamic_cast<ImmediateVantraCommand const *>(command.Get())) {
        Kernel::Activity::Begin();
        ApplicationQueue::Run(*command);
        Kernel::Activity::End();
        return;
    }
    m_Queue->Enqueue(std::move(command));
}

void VantraController::EnqueueCommandAndWait(Counted<VantraCommand> command)
{
    KORVANE_ASSERT_MESSAGE(!ApplicationQueue::IsOnQueue(), "the application's queue waits for itself");
    Kernel::Semaphore ended(0);
    std::vector<std::function<void()>> callbacks;
    callbacks.emplace_back([&ended] { ended.Signal(); });
    command->AddCompletionCallbacks(std::move(callbacks));
    EnqueueCommand(std::move(command));
    ended.Wait(0);
}

bool VantraController::Refuses(DocumentController const & document, DomainCommand const & command, bool byUser)
{
    if (!byUser || !document.IsBookLockEngaged()) {
        return false;
    }
    auto const reason = Kernel::LocalisedString(
        "The document is part of a book that is being updated or output. Try again when that has ended.",
        "Document Commands");
    Broadcast(Kernel::MakeCounted<CommandRefusedNotification>(Counted<DocumentController const>(&document),
                                                              command.GetDescription().ToString(), reason.ToString()));
    return true;
}

bool VantraController::EnqueueCommand(Counted<DocumentCommand> command, Counted<DocumentController const> document,
                                      bool byUser)
{
    Counted<DocumentController> const known = GetMutableDocumentController(document);
    return known && !Refuses(*known, *command, byUser) && known->DomainController::EnqueueCommand(std::move(command));
}

bool VantraController::EnqueueCommand(Counted<DomainCommand> command, Counted<DocumentController const> document,
                                      bool byUser)
{
    if (auto const own = Kernel::CountedCast<DocumentCommand>(command)) {
        return EnqueueCommand(own, std::move(document), byUser);
    }
    return BookSinkCollection::Ask([&](BookSink & sink) { return sink.HandleCommand(document, command); });
}

bool VantraController::EnqueueCommandAndWait(Counted<DocumentCommand> command,
                                             Counted<DocumentController const> document, bool byUser)
{
    Counted<DocumentController> known = GetMutableDocumentController(document);
    return known && EnqueueCommandAndWait(std::move(command), std::move(known), byUser);
}

bool VantraController::EnqueueCommandAndWait(Counted<DocumentCommand> command, Counted<DocumentController> document,
                                             bool byUser)
{
    if (Refuses(*document, *command, byUser) ||
        !document->DomainController::EnqueueCommandAndWait(std::move(command))) {
        return false;
    }
    if (document->IsTextDirty() && m_Registry->IsInBackgroundOnly(*document)) {
        document->DomainController::EnqueueCommandAndWait(Kernel::MakeCounted<ComposeRestCommand>());
    }
    return true;
}

namespace
{

/// Gives protected pictures the passwords that the publication was told in this session.
void RecallPasswords(Counted<DocumentController> const & document)
{
    document->AcquireReaderLock();
    auto const images = document->GetProtectedImages();
    document->ReleaseReaderLock();
    for (Kernel::JailCounted<EmbeddedDocumentNode> const & image : images) {
        String password;
        if (BookSinkCollection::Ask([&](BookSink & sink) {
                password = sink.GetPasswordForGuid(image->GetGUID(), document);
                return !password.Empty();
            })) {
            document->AcquireWriterLock();
            image->SetPassword(password);
            document->ReleaseWriterLock();
        }
    }
}

}

Counted<DocumentController> VantraController::OpenDocument(String const & path,
                                                           OpenDocumentFailedNotification & failure)
{
    Counted<DocumentController> controller = Kernel::MakeCounted<DocumentController>();
    if (m_Registry->ClaimForLoading(path, controller, {})) {
        IncrementLoadingItems();
        bool const loaded = controller->LoadDocument(path, true, false, LoadWhole, nullptr, failure, false);
        DecrementLoadingItems();
        if (!loaded) {
            m_Registry->EndLoading(path, nullptr, true);
            controller->StopOfflining();
            return nullptr;
        }
        m_Registry->EndLoading(path, controller, true);
    } else if (!m_Registry->TakeInFront(*controller)) {
        return controller;
    } else {
        controller->AcquireWriterLock();
        bool const isHeld = controller->HoldFile(true);
        controller->ReleaseWriterLock();
        if (!isHeld) {
            failure.AddWarning(Kernel::Format(
                Kernel::LocalisedString("Another program is reading \"%1\": it can't be saved before that one closes it.",
                                        "Open document"),
                path));
        }
    }
    RecallPasswords(controller);
    IntroduceFront(controller);
    return controller;
}

bool VantraController::AddNewDocument(Counted<DocumentController> document)
{
    if (!m_Registry->AddInFront(document)) {
        return false;
    }
    IntroduceFront(document);
    return true;
}

void VantraController::IntroduceFront(Counted<DocumentController> const & document)
{
    document->SetWantNotifications(true);
    document->SetWantBackgroundTasks(true);
    document->StartBackgroundTaskPump();
    document->KeepCacheBitmap();
    Broadcast(Kernel::MakeCounted<NewDocumentNotification>(document));
}

Counted<DocumentController> VantraController::GetRegisteredDocumentControllerFromPath(String path) const
{
    return m_Registry->FindInFront(path);
}

bool VantraController::IsActiveDocumentController(Counted<DocumentController const> document) const
{
    return document && m_Registry->IsInFront(*document);
}

bool VantraController::IsPurelyForegroundController(Counted<DocumentController const> document) const
{
    return document && m_Registry->IsInFrontOnly(*document);
}

Counted<DocumentController>
VantraController::GetMutableDocumentController(Counted<DocumentController const> document) const
{
    return document ? m_Registry->FindMutable(*document) : nullptr;
}

std::vector<Counted<DocumentController const>> VantraController::GetDocumentControllers() const
{
    return m_Registry->GetListed();
}

bool VantraController::RegisterLoadingController(String const & path, Counted<DocumentController> & controller)
{
    return m_Registry->ClaimForLoading(path, controller, {});
}

bool VantraController::RegisterLoadingController(String const & path, Counted<DocumentController> & controller,
                                                 std::function<void()> const & beforeWaiting)
{
    return m_Registry->ClaimForLoading(path, controller, beforeWaiting);
}

void VantraController::UnregisterLoadingController(String const & path, Counted<DocumentController> controller)
{
    m_Registry->EndLoading(path, std::move(controller), false);
}

void VantraController::RegisterBackgroundController(Counted<DocumentController const> document)
{
    m_Registry->AddUse(*document);
}

bool VantraController::UnregisterBackgroundController(Counted<DocumentController const> document, bool & keepUnsaved)
{
    return m_Registry->EndUse(*document, keepUnsaved);
}

void VantraController::AddDocumentController(Counted<DocumentController> document)
{
    m_Registry->List(*document);
}

bool VantraController::MoveDocumentController(Counted<DocumentController const> document, String const & path)
{
    return m_Registry->Move(*document, path);
}

bool VantraController::ReservePath(Counted<DocumentController const> document, String const & path)
{
    return m_Registry->Reserve(*document, path);
}

void VantraController::ReleasePath(Counted<DocumentController const> document, String const & path)
{
    m_Registry->Release(*document, path);
}

Kernel::Activity::Rest VantraController::WaitUntilIdle()
{
    return Kernel::Activity::WaitForRest();
}

void VantraController::SetViewResamplerTypes(enum Raster::ResamplerType up, enum Raster::ResamplerType down)
{
    m_UpViewResampler = up;
    m_DownViewResampler = down;
}
