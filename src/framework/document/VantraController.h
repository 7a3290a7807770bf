#pragma once

#include "framework/document/DocumentCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/kernel/Activity.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/Notification.h"
#include "framework/kernel/VantraCommand.h"
#include "framework/raster/ResamplerType.h"

#include <atomic>
#include <concepts>
#include <functional>
#include <memory>
#include <vector>

class ApplicationQueue;
class DocumentRegistry;

/// The application: its open documents, the routing of commands to them, its own queue, and the way to everybody's ears.
///
/// A document is open in front (the user has it), in the background (books use it, so many times), or both. There is
/// one document for a path at any time. Everything is safe on any thread; what may wait says so.
class VantraController
{
public:
    static VantraController & GetInstance();
    virtual ~VantraController();

    /// Posts one notification to all broadcast sinks, on lines of their own; never delivers on the calling thread.
    virtual void Broadcast(Kernel::Counted<Kernel::Notification> notification);

    /// Hands a command of the application in: an immediate one is over on return, others run in turn.
    void EnqueueCommand(Kernel::Counted<VantraCommand> command);
    /// The same, and waits for its completion. For front ends; not on the application's own queue.
    void EnqueueCommandAndWait(Kernel::Counted<VantraCommand> command);

    /// Hands a command to a document's queue. `byUser` says that it is the user's own: those are refused while the
    /// document's book holds it still, and a `CommandRefusedNotification` gives the reason. False if it was refused or
    /// the document is not open; then its callback does not run.
    bool EnqueueCommand(Kernel::Counted<DocumentCommand> command, Kernel::Counted<DocumentController const> document,
                        bool byUser);
    /// Any class of document command is one of these.
    template <std::derived_from<DocumentCommand> TCommand>
    bool EnqueueCommand(Kernel::Counted<TCommand> command, Kernel::Counted<DocumentController const> document,
                        bool byUser)
    {
        return EnqueueCommand(Kernel::Counted<DocumentCommand>(std::move(command)), std::move(document), byUser);
    }
    /// The same for a command that may be a book's: the book sinks are asked first.
    bool EnqueueCommand(Kernel::Counted<DomainCommand> command, Kernel::Counted<DocumentController const> document,
                        bool byUser);
    /// The same as the first, and returns when the command has run; at once if it was refused. On a document that
    /// nobody has in front, what the command left uncomposed is composed before it counts as run.
    bool EnqueueCommandAndWait(Kernel::Counted<DocumentCommand> command,
                               Kernel::Counted<DocumentController const> document, bool byUser);
    /// With the mutable document, which need not be known here: one that is being made or imported, for instance.
    bool EnqueueCommandAndWait(Kernel::Counted<DocumentCommand> command, Kernel::Counted<DocumentController> document,
                               bool byUser);

    /// Opens a document in front, with a `NewDocumentNotification`; one that books have open becomes the user's as well.
    /// Waits for others that load or close the same file. Null, with `failure` filled, if it can't be opened.
    Kernel::Counted<DocumentController> OpenDocument(String const & path, OpenDocumentFailedNotification & failure);
    /// Takes a document made in memory in front, under its path; false if the path is open already.
    bool AddNewDocument(Kernel::Counted<DocumentController> document);

    /// The document that is open in front under exactly this path, or null.
    [[nodiscard]] Kernel::Counted<DocumentController> GetRegisteredDocumentControllerFromPath(String path) const;
    /// The user has this document open.
    [[nodiscard]] bool IsActiveDocumentController(Kernel::Counted<DocumentController const> document) const;
    /// The same, and no book uses it.
    [[nodiscard]] bool IsPurelyForegroundController(Kernel::Counted<DocumentController const> document) const;
    /// The mutable form of a document that is loading or open; null otherwise.
    [[nodiscard]] Kernel::Counted<DocumentController>
    GetMutableDocumentController(Kernel::Counted<DocumentController const> document) const;
    /// All open documents, in the order of opening.
    [[nodiscard]] std::vector<Kernel::Counted<DocumentController const>> GetDocumentControllers() const;

    /// Claims a path for loading. True: the caller loads it into `controller`, and ends with
    /// `UnregisterLoadingController`. False: the path is open, and `controller` is its document now, kept open for the
    /// calling thread until its next `RegisterBackgroundController` on it, which must follow. Waits while another
    /// thread loads or closes the path.
    bool RegisterLoadingController(String const & path, Kernel::Counted<DocumentController> & controller);
    /// The same. That other thread's load may itself wait for the user: `beforeWaiting` is called, at most once, before
    /// the wait for it, and lets go of what must not be held so long.
    bool RegisterLoadingController(String const & path, Kernel::Counted<DocumentController> & controller,
                                   std::function<void()> const & beforeWaiting);
    /// Ends the claim. With the document it is open from now on, kept so for the calling thread until its
    /// `RegisterBackgroundController`; with null the load has failed.
    void UnregisterLoadingController(String const & path, Kernel::Counted<DocumentController> controller);

    /// One more background use.
    void RegisterBackgroundController(Kernel::Counted<DocumentController const> document);
    /// One use fewer. Before it counts, everything enqueued on the document so far runs, with its callbacks: it waits.
    /// True: that was the last use, and the user does not have it: it is closing now, and the caller saves it unless
    /// `keepUnsaved`, and sends the `CloseDocumentCommand`.
    bool UnregisterBackgroundController(Kernel::Counted<DocumentController const> document, bool & keepUnsaved);

    /// Puts a freshly loaded document on the application's list, without showing it.
    void AddDocumentController(Kernel::Counted<DocumentController> document);
    /// The document has another path from now on. False if that path belongs to another open document: nothing changes.
    bool MoveDocumentController(Kernel::Counted<DocumentController const> document, String const & path);
    /// Keeps a path for an open document that is about to move there: whoever asks for it gets that document. False if
    /// another one has it. Ends with `MoveDocumentController` or, if nothing comes of it, with `ReleasePath`.
    bool ReservePath(Kernel::Counted<DocumentController const> document, String const & path);
    void ReleasePath(Kernel::Counted<DocumentController const> document, String const & path);

    /// Count of loads under way.
    void IncrementLoadingItems() { ++m_LoadingItems; }
    void DecrementLoadingItems() { --m_LoadingItems; }
    [[nodiscard]] int GetLoadingItems() const { return m_LoadingItems; }

    /// Returns when every queue, delivery line and dirty task of the process has come to rest, or when a question waits
    /// for the user. For front ends and tests, on threads of their own.
    Kernel::Activity::Rest WaitUntilIdle();

    /// Previews of files are wanted: books and documents keep thumbnails. On at first.
    [[nodiscard]] bool ArePreviewsWanted() const { return m_PreviewsWanted; }
    void SetPreviewsWanted(bool wanted) { m_PreviewsWanted = wanted; }
    /// The user can be asked to grant access to a file. On at first: the system shows no dialogue for it, but the file's
    /// owner can change its mode while the question stands, and a retry then finds it open. A front end that nobody
    /// watches turns it off, and gets the question about missing files instead.
    [[nodiscard]] bool CanAskForFilePermission() const { return m_CanAskForFilePermission; }
    void SetCanAskForFilePermission(bool can) { m_CanAskForFilePermission = can; }

    /// How pictures are scaled for views and previews.
    [[nodiscard]] enum Raster::ResamplerType GetUpViewResamplerType() const { return m_UpViewResampler; }
    [[nodiscard]] enum Raster::ResamplerType GetDownViewResamplerType() const { return m_DownViewResampler; }
    void SetViewResamplerTypes(enum Raster::ResamplerType up, enum Raster::ResamplerType down);

private:
    friend class CloseDocumentCommand;
    friend class CloseDocumentTurn;

    VantraController();

    /// The user's command has to wait, and is told so.
    [[nodiscard]] bool Refuses(DocumentController const & document, DomainCommand const & command, bool byUser);
    void IntroduceFront(Kernel::Counted<DocumentController> const & document);

    std::unique_ptr<DocumentRegistry> const m_Registry;
    Kernel::Counted<ApplicationQueue> const m_Queue;
    std::atomic<int> m_LoadingItems{0};
    std::atomic<bool> m_PreviewsWanted{true};
    std::atomic<bool> m_CanAskForFilePermission{true};
    std::atomic<enum Raster::ResamplerType> m_UpViewResampler;
    std::atomic<enum Raster::ResamplerType> m_DownViewResampler;
};
