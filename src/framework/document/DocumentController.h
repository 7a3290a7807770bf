#pragma once

#include "framework/document/DocumentControllerArchive.h"
#include "framework/kernel/DomainController.h"

#include <atomic>

class DocumentNode;
class DocumentSaveResult;
class LoadDocumentOptions;
class OpenDocumentFailedNotification;

/// How `LoadDocument` goes about it.
enum LoadDocumentMode
{
    LoadWhole = 0
};

/// One open document: a domain of its own with its node tree, history and file.
///
/// Changed by commands on its queue. Its tree is read on the queue, or under the reader lock, one stretch at a time and
/// never across a wait. The facts that this class gives out by value are safe on any thread.
class DocumentController : public DomainController, public DocumentControllerArchive
{
public:
    /// No document yet: `LoadDocument` or `NewDocument` makes one.
    DocumentController();
    ~DocumentController() override;

    /// Loads on the calling thread, before anybody else knows the controller. False, with `failure` filled, if it
    /// cannot; then nothing of the file is kept open.
    bool LoadDocument(String const & path, bool inFront, bool asCopy, enum LoadDocumentMode mode,
                      Kernel::Counted<LoadDocumentOptions const> options, OpenDocumentFailedNotification & failure,
                      bool recovering);

    /// The document's root node.
    [[nodiscard]] Kernel::JailCounted<DocumentNode> const & GetDocument() const { return m_Document; }

    /// It has changes that are not saved.
    [[nodiscard]] bool IsDirty() const;
    /// Its owner's mark in the document forbids changing it.
    [[nodiscard]] bool GetRestricted() const;

    /// Writes the document to its file, or to another path, which becomes its own. On the queue's turn or with the
    /// writer lock held, which is given up while the file is written.
    void SaveDocument(DocumentSaveResult & result, String const & path);

    /// Whether its commands post notifications: only those of documents in front do.
    void SetWantNotifications(bool want) { SetSuppressNotifications(!want); }
    [[nodiscard]] bool GetWantNotifications() const { return !GetSuppressNotifications(); }

    /// Holds the document still: `VantraController` refuses the user's commands meanwhile. A plain switch, no count. On
    /// the document's queue.
    void EngageBookLock(bool engage) { m_BookLockEngaged = engage; }
    [[nodiscard]] bool IsBookLockEngaged() const { return m_BookLockEngaged; }

    /// Its queue takes commands: not before it is loaded, and not any more once it closes.
    [[nodiscard]] bool IsAbleToRunCommands() const { return !IsCommandEnqueueDisabled(); }

    /// Closes the file and gives its lock back; what is in memory stays. Again, nothing.
    virtual void ShutDownArchive();
    void StopOfflining() const override;

protected:
    using DocumentControllerArchive::SetPath;

private:
    Kernel::JailCounted<DocumentNode> m_Document;
    std::atomic<bool> m_BookLockEngaged{false};
};
