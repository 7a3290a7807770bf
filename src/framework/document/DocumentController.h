#pragma once

#include "framework/document/Anchors.h"
#include "framework/document/DocumentControllerArchive.h"
#include "framework/document/DocumentFacts.h"
#include "framework/document/DocumentHistory.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/DocumentPictures.h"
#include "framework/document/DocumentSaveResult.h"
#include "framework/document/EmbeddedDocumentNode.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/kernel/DomainController.h"

#include <atomic>

struct DocumentLinks;
struct DocumentSettings;
class DocumentCacheBitmap;
class DocumentStore;

namespace Raster
{
class DynamicBitmap;
}

/// How `LoadDocument` goes about it.
enum LoadDocumentMode
{
    LoadWhole = 0
};

/// Options of a load. There are none yet; callers pass null.
class LoadDocumentOptions : public virtual Kernel::Countable
{
};

/// What composing has changed.
struct ComposeOutcome
{
    /// It gave up because it was told to; the text is still dirty.
    bool m_Aborted = false;
    /// Text was set anew: places within pages have moved.
    bool m_LayoutChanged = false;
    /// There are more or fewer pages, or spreads have another shape.
    bool m_PagesChanged = false;
};

/// One open document: a domain of its own with its node tree, history and file.
///
/// Changed by commands on its queue. Its tree is read on the queue, or under the reader lock, one stretch at a time and
/// never across a wait. The facts that this class gives out by value are snapshots, safe on any thread. A controller
/// that nobody else knows yet belongs to the thread that makes it, which needs no lock; any number of threads may make
/// or load different documents at once.
///
/// A loaded document is composed: where its saved layout does not hold, loading composes.
class DocumentController : public DomainController, public DocumentControllerArchive
{
public:
    static constexpr Kernel::IDTag FileType{"KvDc"};
    /// Version of the document format that this program writes.
    static constexpr unsigned short FormatVersion = 2;

    /// An empty document without pages: `LoadDocument` or `CreateDocument` fills one.
    DocumentController();
    ~DocumentController() override;

    // Making, loading, saving.

    /// A composed document that is in no file yet, dirty, with one growing flow of the story.
    [[nodiscard]] static Kernel::Counted<DocumentController> CreateDocument(DocumentSettings const & settings,
                                                                            Kernel::Counted<Story::Story> story);
    /// Puts another text and other settings in place of all that the document had. The document keeps its GUID, the
    /// uids of anchors whose names are still there and the start numbers of its sections; its history is emptied.
    /// Composes. For a controller that nobody else knows, or under the writer lock.
    void ReplaceContent(DocumentSettings const & settings, Kernel::Counted<Story::Story> story);

    /// Loads on the calling thread, before anybody else knows the controller. False, with `failure` filled, if it
    /// cannot; then nothing of the file is kept open. `inFront` locks the file against all others, otherwise others may
    /// read it. `asCopy` loads the content only: the controller has no path and holds no lock. `recovering` is for
    /// files kept after a failed save and changes nothing about reading them.
    bool LoadDocument(String const & path, bool inFront, bool asCopy, enum LoadDocumentMode mode,
                      Kernel::Counted<LoadDocumentOptions const> options, OpenDocumentFailedNotification & failure,
                      bool recovering);
    /// True if the file is a document of a format older than this program's. Its version goes to `version` if that is
    /// not null. False for a file that can't be read or is none of ours.
    ///
    /// Loading brings an older document up to date in memory and leaves it clean: looking at a file must not take it
    /// from those who have the older program. The next save writes the present format.
    [[nodiscard]] static bool CheckForOldArchiveVersion(String const & path, unsigned int * version);

    /// Writes the document to its file, or to another path, which becomes its own; an empty path means its own. On the
    /// queue's turn or with the writer lock held, which is given up while the file is written; or on a controller that
    /// nobody else knows. What would come out the same to the byte is not written. On failure the file is as it was and
    /// the document is still dirty. An open document that is saved to another path is known under that from then on; it
    /// is refused if another open document has the path.
    void SaveDocument(DocumentSaveResult & result, String const & path);

    /// Writes the document to a path that does not become its own; the document stays as dirty as it was.
    void SaveCopy(DocumentSaveResult & result, String const & path);
    /// The same for a copy that names other paths than the document does.
    void SaveCopy(DocumentSaveResult & result, String const & path, DocumentLinks const & links);
    /// This moment, or another one, as metadata have it: UTC, to the second.
    [[nodiscard]] static String GetTimeText();
    [[nodiscard]] static String GetTimeText(Kernel::TimeStamp time);

    /// Holds its file for the user alone, or lets others read it, for a document that comes in front or leaves it. False if
    /// others hold it as well: then it stays as it was, and saving is refused until they let go; from the save after
    /// that on it is held alone. A file that may only be read is as good as held. Under the writer lock.
    [[nodiscard]] bool HoldFile(bool alone);

    /// Closes the file and gives its lock back; what is in memory stays. Again, nothing.
    virtual void ShutDownArchive();
    void StopOfflining() const override;

    // The tree.

    /// The document's root node; never null.
    [[nodiscard]] Kernel::JailCounted<DocumentNode> const & GetDocument() const { return m_Document; }
    /// The picture files that the document holds.
    [[nodiscard]] DocumentPictures & GetPictures() { return *m_Document->GetPictures(); }
    [[nodiscard]] DocumentPictures const & GetPictures() const { return *m_Document->GetPictures(); }
    /// Placed documents that can't be read without a password, in tree order.
    [[nodiscard]] std::vector<Kernel::JailCounted<EmbeddedDocumentNode>> GetProtectedImages() const;
    /// The one node that the user's view shows alone; null for none. Previews show it alone, too. No file keeps it. Set
    /// under the writer lock.
    [[nodiscard]] Kernel::JailCounted<Node> const & GetSoloNode() const { return m_SoloNode; }
    void SetSoloNode(Kernel::JailCounted<Node> node);

    // State. Safe on any thread.

    /// It has changes that are not saved.
    [[nodiscard]] bool IsDirty() const { return m_ChangeCount != m_SavedCount; }
    /// Something that a file holds has changed. Commands that enter the history need not call it.
    void MarkChanged() { ++m_ChangeCount; }
    /// Its file is of a format older than this program's; false from the first save on. Safe on any thread.
    [[nodiscard]] bool IsFromOlderVersion() const { return m_FromOlderVersion; }
    /// Its owner's mark in the document forbids changing it.
    [[nodiscard]] bool GetRestricted() const { return m_Restricted; }
    void SetRestricted(bool restricted) { m_Restricted = restricted; }
    /// Identity of the document; it stays when the file is copied or made anew.
    [[nodiscard]] String GetGUID() const { return m_Facts.Get()->m_Guid; }

    /// Facts in snapshots; changing them is for commands and for who makes the document.
    [[nodiscard]] Kernel::Counted<DocumentMetadata const> GetMetadata() const { return m_Facts.Get()->m_Metadata; }
    void SetMetadata(DocumentMetadata::Values metadata);
    /// What colours are meant in: of the conversion for output while one is in force.
    [[nodiscard]] enum Raster::Format GetFormat() const { return m_Facts.Get()->GetFormat(); }
    [[nodiscard]] Raster::ICCManager::ICCProfileSet GetProfiles() const { return m_Facts.Get()->GetProfiles(); }
    /// The profile of the format.
    [[nodiscard]] Kernel::Consolidated<Raster::ICCProfile> GetProfile() const;
    void SetFormatAndProfiles(enum Raster::Format format, Raster::ICCManager::ICCProfileSet const & profiles);
    /// Lays a format over the document's own, or takes that off again; see `ConvertFormatOrProfileCommand`. True if
    /// there was one to take off.
    void SetFormatOverride(enum Raster::Format format, Raster::ICCManager::ICCProfileSet const & profiles);
    bool RemoveFormatOverride();
    [[nodiscard]] Kernel::Counted<Kernel::UnitValueConverter const> GetUnitConverter() const { return m_UnitConverter; }
    [[nodiscard]] enum Kernel::UnitValue::UnitType GetUnitType() const { return Kernel::UnitValue::UnitType::Points; }

    /// Null before the first check.
    [[nodiscard]] Kernel::Counted<PreflightResults const> GetPreflightResults() const
    {
        return m_Facts.Get()->m_Preflight;
    }
    void SetPreflightResults(Kernel::Counted<PreflightResults const> results);
    /// Null for a document that never was given one.
    [[nodiscard]] Kernel::Counted<PDFBookmarkManager const> GetPDFBookmarkManager() const
    {
        return m_Facts.Get()->m_Bookmarks;
    }
    void SetPDFBookmarkManager(Kernel::Counted<PDFBookmarkManager const> manager);
    /// The anchors as last collected in a document in front; null if they never were.
    [[nodiscard]] Kernel::Counted<Anchors const> GetAnchors() const { return m_Facts.Get()->m_Anchors; }
    /// Nothing has changed since they were collected.
    [[nodiscard]] bool AreAnchorsCurrent() const { return m_AnchorsCurrent; }
    /// Collects them. Under the reader lock at least.
    void CollectAnchors();
    /// Where anchors stand, or which there are, may have changed.
    void SetAnchorsOutOfDate() { m_AnchorsCurrent = false; }
    /// A picture of the spread that is kept ready: documents in front keep one of the first spread, in the document's
    /// format and on a transparent ground (see `DocumentCacheBitmap`). With `current` a picture that is missing or
    /// behind the document is made first, on the calling thread under the reader lock; without it the answer is what
    /// there is, which for a document that keeps none is the preview in its file, however old. Null if there is
    /// nothing, and for any other spread.
    [[nodiscard]] Kernel::Counted<Raster::DynamicBitmap const> GetDocumentCacheBitmap(int spreadIndex,
                                                                                      bool current) const;
    /// Begins to keep the picture, with which each save renews the preview in the file. For a document that comes in
    /// front, and for one that is made to be looked for; again, nothing.
    void KeepCacheBitmap();
    /// Grows with everything that may make the document look different.
    [[nodiscard]] std::uint64_t GetAppearanceCount() const { return m_ChangeCount + m_LayoutCount; }

    /// Whether its commands post notifications: only those of documents in front do.
    void SetWantNotifications(bool want) { SetSuppressNotifications(!want); }
    [[nodiscard]] bool GetWantNotifications() const { return !GetSuppressNotifications(); }
    /// Holds the document still: `VantraController` refuses the user's commands meanwhile. A plain switch, no count. On
    /// the document's queue.
    void EngageBookLock(bool engage) { m_BookLockEngaged = engage; }
    [[nodiscard]] bool IsBookLockEngaged() const { return m_BookLockEngaged; }
    /// Its queue takes commands: not before it is loaded, and not any more once it closes.
    [[nodiscard]] bool IsAbleToRunCommands() const { return m_Loaded && !IsCommandEnqueueDisabled(); }

    // Text.

    /// The text, styles or sections have changed since the pages were last composed.
    [[nodiscard]] bool IsTextDirty() const { return m_TextDirty; }
    void SetTextDirty() { m_TextDirty = true; }
    /// Brings layouts and pages in step with text, styles and sections. With `force` also where nothing seems to have
    /// changed. `abort` may be null. Under the writer lock.
    ComposeOutcome ComposeText(bool force, bool * abort);

    /// Makes the glyphs of all flows available for drawing; where they can't be read from the file any more, or their
    /// fonts have gone, the text is set anew, under the writer lock, which it takes if need be. Not with the reader
    /// lock held.
    void EnsureGlyphs();
    /// Brings what running heads show in step with the title and, for a document without one, its first heading. Under
    /// the writer lock.
    void UpdateRunningHeads();

    // History. Under the writer lock.

    [[nodiscard]] DocumentHistory & GetHistory() { return m_History; }

    void ProcessCommand(Kernel::Counted<DomainCommand> command,
                        std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;
    /// Tells of what composing has changed.
    void AppendComposeNotifications(ComposeOutcome const & outcome,
                                    std::vector<Kernel::Counted<Kernel::Notification>> & notifications) const;

protected:
    using DocumentControllerArchive::SetPath;
    bool StackForUndo(Kernel::Counted<DomainCommand> const & command) override;

private:
    friend class DocumentFile;

    /// The topics of the story's index marks are in the index afterwards.
    void ReplaceIndexTopics(Story::Story const & story);

    /// The open file; its own lock.
    Kernel::Counted<DocumentStore> const m_Store;
    Kernel::JailCounted<DocumentNode> const m_Document;
    Kernel::JailCounted<Node> m_SoloNode;
    DocumentHistory m_History;
    PublishedDocumentFacts m_Facts;
    Kernel::Counted<Kernel::UnitValueConverter const> const m_UnitConverter;
    std::atomic<std::uint64_t> m_ChangeCount{0};
    std::atomic<std::uint64_t> m_SavedCount{0};
    /// Layouts that composing has changed, and views.
    std::atomic<std::uint64_t> m_LayoutCount{0};
    Kernel::Counted<DocumentCacheBitmap> const m_CacheBitmap;
    std::atomic<bool> m_KeepsCacheBitmap{false};
    std::atomic<bool> m_FromOlderVersion{false};
    std::atomic<bool> m_Restricted{false};
    std::atomic<bool> m_TextDirty{false};
    std::atomic<bool> m_AnchorsCurrent{false};
    std::atomic<bool> m_Loaded{false};
    std::atomic<bool> m_BookLockEngaged{false};
    /// The user has it: its file is to be locked against all others.
    std::atomic<bool> m_HoldAlone{false};
};
