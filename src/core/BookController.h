#pragma once

#include "core/BookChapter.h"
#include "core/Published.h"
#include "framework/document/DocumentController.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/DomainController.h"
#include "framework/kernel/FileStoreItem.h"
#include "framework/kernel/PostingFlag.h"
#include "framework/kernel/StringT.h"

#include <atomic>
#include <deque>
#include <map>
#include <string_view>
#include <utility>
#include <vector>

class Anchors;
class DocumentSaveResult;
class OpenDocumentFailedNotification;
class PDFBookmarkManager;
namespace Kernel
{
class ArchiveThumbnails;
}
namespace Raster
{
class DynamicBitmap;
}
namespace Renderer
{
class FileExportOptions;
}
namespace Story
{
class Index;
}

namespace Book
{

class UpdateChaptersTask;

/// One open book: its chapters in reading order, its few settings, its path and whether it needs saving. As a
/// `DomainController` it has a command queue and a reader/writer lock of its own, and everything that changes a book
/// goes through a `BookCommand` on that queue. As a `Kernel::FileStoreItem` it is what the book file holds.
///
/// Made by `NewBookCommand` or `LoadBookCommand`; registered in `BookCollection`, which drops it when the front end has
/// seen `BookClosedNotification`. Readers hold `Kernel::Counted<BookController const>`.
///
/// Threads: the chapter list is an immutable snapshot that writers swap, and single values are published one by one, so
/// any thread may ask at any time and gets what was so at one moment. Whoever needs several answers that fit together
/// is a command of the book, or holds its reader lock. Writers are commands on the book's queue, answers to the book's
/// questions (turns of the same queue), and `BookCollection::UpdateChapter`, all under the writer lock.
///
/// Who implements what: the list, the settings and the book file lie in this folder; chapter documents, status, adding,
/// missing files and the book lock in `documents`; index and anchors in `content`.
class BookController final : public DomainController, public Kernel::FileStoreItem
{
public:
    using ChapterList = std::vector<Kernel::Counted<BookChapter>>;
    using ConstChapterList = std::vector<Kernel::Counted<BookChapter const>>;

    /// What synchronising chapters with the key chapter touches.
    struct SynchroniseSettings
    {
        bool m_Swatches = true;
        bool m_TextStyles = true;
        bool m_TableStyles = true;
        bool m_MasterPages = true;
        friend bool operator==(SynchroniseSettings const &, SynchroniseSettings const &) = default;
    };

    /// An empty book without a file, clean, no pump running.
    BookController();
    ~BookController() override;

    // The chapter list ------------------------------------------------------------------------------------------------

    [[nodiscard]] int ChapterCount() const;
    [[nodiscard]] bool HasChapters() const;
    /// Iterators of the list as it is now. Good until the list changes, so only for the book's own turns and for those
    /// that hold its reader lock; others take a copy with `GetChapters`.
    [[nodiscard]] ChapterList::const_iterator ChapterBegin() const;
    [[nodiscard]] ChapterList::const_iterator ChapterEnd() const;
    /// Null for an index out of range.
    [[nodiscard]] Kernel::JailCounted<BookChapter> GetChapterAtIndex(int index);
    [[nodiscard]] Kernel::Counted<BookChapter const> GetChapterAtIndex(int index) const;
    /// -1 if the book does not hold the chapter.
    [[nodiscard]] int IndexFromChapter(Kernel::Counted<BookChapter const> chapter) const;
    /// The neighbours; null at the ends and for a chapter that the book does not hold.
    [[nodiscard]] Kernel::Counted<BookChapter const> GetNextChapter(Kernel::Counted<BookChapter const> chapter) const;
    [[nodiscard]] Kernel::Counted<BookChapter const>
    GetPreviousChapter(Kernel::Counted<BookChapter const> chapter) const;
    /// Appends all chapters.
    void GetChapters(ConstChapterList & chapters) const;
    /// Appends the chapters behind the given one; none if the book does not hold it.
    void GetChaptersAfter(ConstChapterList & chapters, Kernel::Counted<BookChapter const> chapter) const;
    /// The same record in mutable form; null if the book does not hold it (any more).
    [[nodiscard]] Kernel::Counted<BookChapter> GetMutableChapter(Kernel::Counted<BookChapter const> chapter) const;
    /// The first chapter whose path is the same byte for byte, or null.
    [[nodiscard]] Kernel::Counted<BookChapter> GetChapterFromPath(String const & path);
    [[nodiscard]] Kernel::Counted<BookChapter const> GetChapterFromPath(String const & path) const;
    [[nodiscard]] bool ContainsChapter(String const & path) const;
    [[nodiscard]] bool ContainsValidChapters() const;
    /// Some chapter is believed to be open for editing, and the application no longer has its document.
    [[nodiscard]] bool ContainsEstrangedChapters() const;
    [[nodiscard]] Kernel::Counted<BookChapter const> GetChapterWithIndex() const;
    [[nodiscard]] Kernel::Counted<BookChapter const> GetChapterWithEndnotesMarker() const;
    [[nodiscard]] bool HasEndnotesMarker() const;

    /// Adds the file at `path` in front of the chapter at `index`; a negative index or one past the end appends. Opens
    /// the file once to learn what is in it. The first chapter of a book becomes its key chapter. Null if the path is
    /// in the book already: nothing has changed then.
    Kernel::Counted<BookChapter> AddChapter(String const & path, int index);
    /// Takes the chapters out; those that the book does not hold are passed over. If the key chapter goes, the first
    /// one that remains becomes key, and the book has no thumbnail until it is looked at again. Whatever comes to stand
    /// first starts at the page that it had.
    void RemoveChapters(ConstChapterList const & chapters);
    /// Puts a new record for `path` in the place of `old` and gives it; null if the book does not hold `old`. Only the
    /// place and the key flag carry over.
    Kernel::Counted<BookChapter> ReplaceChapter(Kernel::Counted<BookChapter const> old, String const & path);
    /// Moves the chapters, in the given order, as a block in front of `before`, or to the end if that is null or among
    /// them. If the first chapter started at page 1, the one that comes first now does. Nothing happens at all if the
    /// book does not hold one of them.
    void MoveChapters(Kernel::Counted<BookChapter const> before, ConstChapterList chapters);
    /// The first chapter starts at the page that it last had, whatever came before it.
    void OnFirstChapterChanged();

    // Key chapter: the style source of the book -----------------------------------------------------------------------

    /// The first valid chapter with the key flag. If there is none, null, or with `fallBack` the first valid chapter.
    [[nodiscard]] Kernel::JailCounted<BookChapter> GetKeyChapter(bool fallBack);
    [[nodiscard]] Kernel::Counted<BookChapter const> GetKeyChapter(bool fallBack) const;
    [[nodiscard]] bool HasValidKeyChapter() const;
    /// Moves the key flag. A flagged chapter that is not valid at the time keeps its flag, so that two can carry it.
    void SetKeyChapter(Kernel::Counted<BookChapter const> chapter);

    // Settings --------------------------------------------------------------------------------------------------------
    // Stray handling, synchronise settings and thumbnail reach the book file and yet do not make the book unsaved: they
    // are no work that somebody could lose.

    [[nodiscard]] bool IsPadStrays() const { return m_PadStrays; }
    void SetPadStrays(bool pad) { m_PadStrays = pad; }
    [[nodiscard]] bool IsMergeStrays() const { return m_MergeStrays; }
    void SetMergeStrays(bool merge) { m_MergeStrays = merge; }
    [[nodiscard]] SynchroniseSettings GetSynchroniseSettings() const;
    void SetSynchroniseSettings(SynchroniseSettings const & settings);
    [[nodiscard]] Kernel::Consolidated<Renderer::FileExportOptions> GetExportOptions() const;
    void SetExportOptions(Kernel::Consolidated<Renderer::FileExportOptions> options);
    /// The bookmark manager that the book file keeps; null until anchors were first looked at.
    [[nodiscard]] Kernel::Counted<PDFBookmarkManager const> GetPDFBookmarks() const;
    /// A bitmap of the key chapter's first spread; null if none is known.
    [[nodiscard]] Kernel::Counted<Raster::DynamicBitmap const> GetThumbnail() const;
    /// The key chapter's document has drawn its first spread anew. A handle swap, without a lock.
    void UpdateThumbnail(Kernel::Counted<Raster::DynamicBitmap const> thumbnail);
    [[nodiscard]] Kernel::Counted<Story::Index const> GetMasterIndex() const;

    // Identity and state ----------------------------------------------------------------------------------------------

    /// Empty for a book that has no file.
    [[nodiscard]] String GetPath() const;
    void SetPath(String const & path);
    /// The book's title for the user: the file's name without extension, or "Untitled" with `number` behind it from 2
    /// on; followed by a mark if the book has changes and `markModified` asks for it. Translated.
    [[nodiscard]] String GetName(int number, bool markModified) const;
    [[nodiscard]] bool IsDirty() const { return m_Changes != m_SavedChanges; }
    void SetIsDirty(bool dirty);
    /// A book without a file can always be saved, another one if it has changes.
    [[nodiscard]] bool CanSave() const;
    /// Starts the background passes of a book that has just been made.
    void NewBook();

    // Updates that are running. What an update itself provokes must not start another one, so on a thread that delivers
    // a notification the answer is about the time when that was posted.

    [[nodiscard]] bool IsInIndexUpdate() const { return m_InIndexUpdate.IsSet(); }
    void SetInIndexUpdate(bool inUpdate) { m_InIndexUpdate.Set(inUpdate); }
    [[nodiscard]] bool IsInReconcileAnchors() const { return m_InReconcileAnchors.IsSet(); }
    void SetInReconcileAnchors(bool inUpdate) { m_InReconcileAnchors.Set(inUpdate); }
    [[nodiscard]] bool IsInNumberUpdate() const { return m_InNumberUpdate.IsSet(); }
    void SetInNumberUpdate(bool inUpdate) { m_InNumberUpdate.Set(inUpdate); }

    // Background passes (any thread) ----------------------------------------------------------------------------------

    /// Asks for a pass over all chapters. Nothing before the pump was started.
    void UpdateChapters();
    /// Asks for a pass over the chapters that the user has open.
    void UpdateForegroundChapters();
    void OnUpdateChaptersComplete();
    void OnUpdateForegroundChaptersComplete();
    void StartBackgroundTaskPump() override;

    // The book file ---------------------------------------------------------------------------------------------------

    void Save(Kernel::OutStream & stream, Kernel::FileStoreOut & store) const override;
    bool Load(Kernel::InStream & stream, Kernel::FileStore & store) override;
    [[nodiscard]] Kernel::FileStoreItemType const & GetObjectFileStoreItemType() const override;
    static Kernel::FileStoreItemType const & GetTypeFileStoreItemType();
    static Kernel::Counted<Kernel::FileStoreItem> CreateObject();
    static Kernel::FileStoreItemType const ms_FileStoreItemType;

    /// Reads the book at `path` and starts the background passes. On failure false, with the reason in `result`; the
    /// controller is then good for nothing. For a controller that nobody else has seen.
    bool LoadBook(String const & path, OpenDocumentFailedNotification & result);
    /// Writes the book to its own path.
    void SaveBook(DocumentSaveResult & result);
    /// Writes the book to `path`, and the book is at that path from then on. An existing file stays whole if the write
    /// fails. Call it without the book's writer lock, on the book's own turn.
    void SaveBookAsCopy(DocumentSaveResult & result, String const & path);
    using ChapterPaths = std::map<Kernel::Counted<BookChapter const>, String>;
    /// The same for a book file that is to be moved together with the copies of these chapters: it names them by their
    /// place beside it. In the open book the chapters keep their paths.
    void SaveBookAsPackage(DocumentSaveResult & result, String const & path, ChapterPaths packaged);

    // Chapter documents -----------------------------------------------------------------------------------------------

    /// The chapter's document: the user's own if it is open, another book's or pass's if that has it, else freshly
    /// opened, unseen by the user. Each result that is not null has to be given back by `ReleaseChapterDocument`. Null
    /// if the file cannot be opened (the chapter's status then says why), or if it is restricted and `allowRestricted`
    /// is false. `reconcile` also brings the document's index and anchors in step with the book.
    ///
    /// Loads on the calling thread. May wait for a close of the same chapter, for others that load the same file, and
    /// for the user's passwords; never with the book's writer lock held for the last two.
    Kernel::Counted<DocumentController> LoadChapterDocument(Kernel::Counted<BookChapter const> chapter, bool reconcile,
                                                            bool allowRestricted);
    /// Ends one use. The last one saves the document if it has changes, and closes it in the background;
    /// `updateTimeStamp` then notes the file's time as looked at. False if the book holds no document for the chapter.
    bool ReleaseChapterDocument(Kernel::Counted<BookChapter const> chapter, bool updateTimeStamp) const;
    /// The document that the book holds for the chapter, or null; one that has closed under it, by another book's hand,
    /// does not count. With `preferForeground` the user's own comes first.
    /// Counts no use.
    [[nodiscard]] Kernel::Counted<DocumentController>
    GetDocumentControllerForChapter(Kernel::Counted<BookChapter const> chapter, bool preferForeground) const;
    [[nodiscard]] bool IsThisChapterThisDocument(Kernel::Counted<BookChapter const> chapter,
                                                 Kernel::Counted<DocumentController const> document) const;
    /// The chapter whose document this is: by the documents that the book holds, then by path. Null if none.
    [[nodiscard]] Kernel::Counted<BookChapter>
    GetChapterFromDocumentController(Kernel::Counted<DocumentController const> document);
    [[nodiscard]] Kernel::Counted<BookChapter const>
    GetChapterFromDocumentController(Kernel::Counted<DocumentController const> document) const;
    /// The user has the chapter open.
    [[nodiscard]] bool IsForegroundChapter(Kernel::Counted<BookChapter const> chapter) const;
    /// Appends for each chapter that the user has open its index in the book and its document's name.
    void GetForegroundChapters(std::vector<std::pair<int, String>> & chapters) const;
    /// The open documents of these paths, in their order; with no path at all those of all chapters.
    [[nodiscard]] std::vector<Kernel::Counted<DocumentController const>>
    GetForegroundControllers(std::vector<String> const & paths) const;
    /// Some chapter is open in the user's hands.
    [[nodiscard]] bool CanCloseOpenChapters() const;
    /// Some chapter in the user's hands has unsaved changes.
    [[nodiscard]] bool CanSaveOpenChapters() const;
    /// Starts a save of each of these, and does not wait.
    void SaveOpenChapters() const;
    /// The user has opened this document, which is a chapter of the book.
    void OnDocumentOpen(Kernel::Counted<DocumentController const> document);

    // Status ----------------------------------------------------------------------------------------------------------

    /// Copies every fact that the book keeps from the document into the record; a null `document` is opened for the
    /// call. With `updateTimeStamp` the file counts as looked at. With `adoptStartPage` the chapter takes over the
    /// number of its first section as a start of its own, unless it is a later chapter with an untouched first section.
    /// True only if `document` and `updateTimeStamp` were given and the file's time had changed.
    ///
    /// Does not set the status: that is done where its cause is known.
    bool UpdateChapterStatus(Kernel::Counted<BookChapter> chapter, Kernel::Counted<DocumentController const> document,
                             bool updateTimeStamp, bool adoptStartPage);
    /// The same for a chapter of this book; false for another one.
    bool UpdateChapterStatus(Kernel::Counted<BookChapter const> chapter,
                             Kernel::Counted<DocumentController const> document, bool updateTimeStamp,
                             bool adoptStartPage);
    /// Updates each chapter that the user has open, from the open document.
    void UpdateForegroundChapterStatus();
    /// The same for readers, under the reader lock, so that no command of the book is half done meanwhile. It composes
    /// nothing: where a chapter's text is not laid out, that is left to the document's queue, without waiting.
    void UpdateForegroundChapterStatus() const;
    /// Takes over the document's preflight results, after running the check if `run` says so.
    void UpdatePreflightStatus(Kernel::Counted<BookChapter const> chapter,
                               Kernel::Counted<DocumentController const> document, bool run);

    // Adding with questions -------------------------------------------------------------------------------------------

    /// Adds the files in front of `before`, or at the end if that is null or not in the book. Stops to ask the user
    /// about files of an older version, and goes on by itself when the answer comes.
    void AddChapters(std::deque<String> paths, Kernel::Counted<BookChapter const> before);
    /// Takes out again what the add in progress has put in, and forgets the rest.
    void CancelAddChapters();

    // Missing files ---------------------------------------------------------------------------------------------------

    /// Tries every chapter's file, and asks the user about those that do not open.
    void CollateMissingChapters();
    /// Puts the one question that the state calls for, or none. What has left the book meanwhile is not asked about.
    void NotifyMissingChapters();
    /// The user's answer whether to look for missing chapters.
    void RespondMissingChapterPrompt(bool locate);
    /// The user's answer where the file at `oldPath` has gone; empty if there was none. What changed in the path is
    /// remembered and tried on all other missing chapters.
    void ResolveMissingChapters(String oldPath, String newPath);
    void RetryFilePermissions(bool ignoreAll);
    void IgnoreFilePermissions(Kernel::Counted<BookChapter const> const & chapter);
    void IgnoreAllFilePermissions();

    /// Makes every chapter that the user has open hold still, or lets it go again. Waits for each document in turn.
    void EngageBookLock(bool engage);

    // Index: one tree of topics for all chapters (in content) ---------------------------------------------------------

    /// `index` becomes the master, with a GUID for every topic, and all open chapters but the one that it came from are
    /// brought in step.
    void SetMasterIndex(Kernel::Counted<Story::Index const> index);
    /// Brings the document's topics in step with the master, which also learns topics that it did not know.
    void ReconcileIndex(Kernel::Counted<DocumentController const> document);

    // Anchors: what a cross-reference needs to know of other chapters (in content) ------------------------------------

    /// Brings the chapter's anchors up to date; null `anchors` means that they have to be found first.
    void UpdateChapterAnchors(Kernel::Counted<BookChapter> chapter, Kernel::Counted<DocumentController const> document,
                              Kernel::Counted<Anchors> anchors);
    void UpdateChapterAnchors(Kernel::Counted<BookChapter> chapter, Kernel::Counted<DocumentController const> document,
                              Kernel::Counted<Anchors> anchors, int chapterIndex);
    /// The user has changed anchors of this document.
    void UpdateAnchors(Kernel::Counted<BookChapter const> chapter, Kernel::Counted<DocumentController const> document);
    void UpdateAnchorsForForegroundChapters();
    /// What is known of the anchor, or null. Good to the end of the calling turn, whatever happens to the chapter; the
    /// implementation keeps the list for the turn (`Snapshot::KeepForTurn`).
    [[nodiscard]] AnchorInfo const * GetAnchorInfo(String const & uid) const;
    /// The first chapter with this anchor, or null.
    [[nodiscard]] Kernel::Counted<BookChapter const> GetChapterContainingAnchor(String const & uid) const;
    /// Adds the anchors of all chapters but the asking one, as anchors without a place.
    void AddBlindAnchors(Kernel::Counted<Anchors> anchors, Kernel::Counted<BookChapter const> chapter,
                         Kernel::Counted<PDFBookmarkManager const> manager) const;
    /// Gives every anchor of the document an identity, and the document the book's bookmarks.
    void ReconcileAnchors(Kernel::Counted<BookChapter> chapter, Kernel::Counted<DocumentController const> document);

private:
    using ChapterDocuments = std::map<Kernel::Counted<BookChapter const>, Kernel::Counted<DocumentController>>;
    /// Paths of chapters as they were learnt to have moved: old prefix, new prefix.
    using PathChanges = std::vector<std::pair<String, String>>;

    [[nodiscard]] Snapshot<ChapterList> Chapters() const { return m_Chapters.Get(); }
    /// Publishes the list with `change` done to it. Writers come one at a time, under the writer lock.
    template <typename TChange>
    void ChangeChapters(TChange const & change);
    void MarkChanged() { ++m_Changes; }

    /// With stand-ins for the chapters that are written under another path.
    [[nodiscard]] ChapterList RecordsToWrite(ChapterList chapters) const;

    /// The preview for the book file: the thumbnail in the present shape of the key chapter's first spread, as one PNG of
    /// at most 512 pixels. Null if previews are not wanted, there is no key chapter or no thumbnail, or the spread is so
    /// thin that a side has no pixel left.
    [[nodiscard]] Kernel::Counted<Kernel::ArchiveThumbnails> CreateThumbnails() const;
    /// A bitmap of a document's first spread; null if that has no area.
    [[nodiscard]] Kernel::Counted<Raster::DynamicBitmap>
    RenderChapterThumbnail(Kernel::Counted<DocumentController const> const & document) const;

    // The steps of LoadChapterDocument.
    void WaitForClose(Kernel::Counted<BookChapter const> const & chapter) const;
    /// The document that the book holds for the chapter, if that is no longer at this path: the user has saved it under
    /// another one meanwhile, and until its uses have ended it stays the chapter's. Counts a use.
    Kernel::Counted<DocumentController> UseMovedDocument(Kernel::Counted<BookChapter const> const & chapter,
                                                         String const & path) const;
    Kernel::Counted<DocumentController> AdoptForegroundDocument(Kernel::Counted<BookChapter const> const & chapter,
                                                                Kernel::Counted<DocumentController> document,
                                                                bool reconcile);
    Kernel::Counted<DocumentController> UseDocumentLoadedElsewhere(Kernel::Counted<BookChapter const> const & chapter,
                                                                   Kernel::Counted<DocumentController> document);
    Kernel::Counted<DocumentController> OpenChapterDocument(Kernel::Counted<BookChapter const> const & chapter,
                                                            Kernel::Counted<DocumentController> document,
                                                            bool reconcile);
    void AskForPasswords(Kernel::Counted<BookChapter> const & chapter,
                         Kernel::Counted<DocumentController> const & document) const;
    /// Enters the document in the table and counts a use, in one step.
    void StoreAndUse(Kernel::Counted<BookChapter const> const & chapter,
                     Kernel::Counted<DocumentController> const & document, bool adopted) const;
    /// The caller holds the lock of the table.
    void StoreChapterDocument(Kernel::Counted<BookChapter const> const & chapter,
                              Kernel::Counted<DocumentController> document, bool adopted) const;
    /// Takes the chapter out of the table; the caller holds its lock.
    void ForgetChapterDocument(Kernel::Counted<BookChapter const> const & chapter) const;
    void CloseChapterDocument(Kernel::Counted<BookChapter const> const & chapter,
                              Kernel::Counted<DocumentController> const & document) const;

    /// An earlier chapter of the book has endnotes.
    [[nodiscard]] bool HasEndnotesBefore(Kernel::Counted<BookChapter const> const & chapter) const;
    /// Advances `next` over the document's endnotes that run through the book (in content).
    static void InvestigateEndnotes(Kernel::Counted<DocumentController const> document, int & next);
    void UpdatePreflightStatus(Kernel::Counted<BookChapter> chapter, Kernel::Counted<DocumentController const> document,
                               bool run);

    /// Runs the queue of files until it is empty, or until there is a question to the user.
    void DoAddChapters();
    void AskAboutOldVersion(String const & path);
    /// The user has agreed: writes the chapter's file in the present format, unless its owner forbids changing it.
    void UpgradeChapter(Kernel::Counted<BookChapter const> const & chapter);
    bool ResolveChapterFilePath(String oldPath, String & newPath, Kernel::Counted<BookChapter> chapter) const;

    void MapIndexGUIDs(Kernel::Counted<DocumentController const> document, Kernel::Counted<Story::Index const> index);
    void AddMissingTopics(Kernel::Counted<DocumentController const> document,
                          Kernel::Counted<Story::Index const> index);
    void SynchronizeIndexStructure(Kernel::Counted<DocumentController const> document,
                                   Kernel::Counted<Story::Index const> index);
    /// True if the master learnt a topic.
    bool AdoptOrphanTopics(Kernel::Counted<DocumentController const> document,
                           Kernel::Counted<Story::Index const> index);
    /// Opens the chapter and fetches its anchors if they are known to be stale. A query's only way to open a document.
    void EnsureChapterAnchors(Kernel::Counted<BookChapter const> chapter) const;

    /// Chapters with a document in the book's hands, and those of them that the user had open first. Changed under the
    /// lock, which is never held across a wait; read without it.
    mutable Published<Snapshot<ChapterDocuments>> m_ChapterDocuments;
    mutable std::map<Kernel::Counted<BookChapter const>, bool> m_AdoptedChapters;
    Kernel::CriticalSection m_ChapterDocumentsLock;

    Published<Snapshot<ChapterList>> m_Chapters;
    ChapterList m_MissingChapters;
    Kernel::Counted<BookChapter const> m_ForbiddenChapter;
    Published<String> m_Path;
    /// The path being written while a save runs, for the objects in the file that refer to other files.
    Published<String> m_SavePath;
    /// Chapters that are written under another path, while a save runs. For the saving thread alone.
    ChapterPaths m_PackagedPaths;
    Published<Kernel::Counted<Story::Index const>> m_MasterIndex;
    /// The book needs saving while these differ. Counts, so that a save settles only the changes that it has written.
    std::atomic<unsigned long long> m_Changes{0};
    std::atomic<unsigned long long> m_SavedChanges{0};
    mutable Published<Kernel::Counted<PDFBookmarkManager const>> m_PDFBookmarks;
    Kernel::PostingFlag m_InIndexUpdate;
    Kernel::PostingFlag m_InReconcileAnchors;
    Kernel::PostingFlag m_InNumberUpdate;
    std::atomic<bool> m_PadStrays{false};
    std::atomic<bool> m_MergeStrays{true};
    Published<Kernel::Counted<Raster::DynamicBitmap const>> m_Thumbnail;
    Published<SynchroniseSettings> m_SynchroniseSettings;
    Published<Kernel::Counted<UpdateChaptersTask>> m_UpdateChaptersTask;
    Published<Kernel::Counted<UpdateChaptersTask>> m_UpdateForegroundChaptersTask;
    Published<Kernel::Consolidated<Renderer::FileExportOptions>> m_ExportOptions;
    PathChanges m_ChapterPathChanges;
    /// The add in progress: files not yet handled, what went in (null for a file that was there already), and where the
    /// next one goes, -1 for the end.
    std::deque<String> m_PendingChapterPaths;
    ChapterList m_AddedChapters;
    int m_AddChapterIndex = -1;
};

}
