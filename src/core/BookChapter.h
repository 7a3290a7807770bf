#pragma once

#include "core/Published.h"
#include "core/SpreadInfo.h"
#include "framework/document/AnchorInfo.h"
#include "framework/document/PreflightResults.h"
#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/LocalisedString.h"
#include "framework/kernel/Serialisable.h"
#include "framework/kernel/StringT.h"
#include "framework/kernel/TimeStamp.h"
#include "framework/kernel/UnitValue.h"
#include "framework/kernel/UnitValueConverter.h"
#include "framework/raster/Format.h"
#include "framework/raster/ICCManager.h"

#include <atomic>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

class DocumentMetadata;
namespace Story
{
class Story;
}

namespace Book
{

struct ChapterFacts;

/// A book's record of one chapter: where its document file lies, what the user set for it in the book, and what the
/// book last learnt about the document. Path, pages text, name, key flag, start page, endnotes marker and time stamp go
/// into the book file; everything else is a cache that the status update fills from the open document
/// (`BookController::UpdateChapterStatus`), so that the book can number, plan and show its chapters while they are
/// closed.
///
/// Owned by the chapter list of one `BookController`; readers hold `Kernel::Counted<BookChapter const>`. A mutable
/// record is had from `BookController::GetMutableChapter` only.
///
/// Threads: any thread may read at any time. All facts lie in one immutable value that a setter replaces as a whole, so
/// a getter gives its result by value (lists as a `Snapshot`), and what it gave does not change afterwards. Writers are
/// the book's commands and whoever holds the book's writer lock, and the load and close of the chapter's document;
/// each setter takes the record's own writer lock, and `UpdateSession` makes several of them one step for readers.
class BookChapter final : public Kernel::Serialisable
{
public:
    /// Numbers are part of what front ends show and script against.
    enum class Status : int
    {
        Ok = 0,
        OpenForEdit = 1,
        Locked = 2,
        NotFound = 3,
        OutOfDate = 4,
        /// Never stored: what `GetStatus` gives for a restricted chapter, whatever else is known of it.
        Restricted = 5
    };

    using SpreadInfo = Book::SpreadInfo;

    /// Makes all sets that this thread does on one record, from construction to destruction, visible to readers at
    /// once. Holds the record's writer lock: wait for nothing while it lives. Getters of this thread see its own sets.
    class UpdateSession
    {
    public:
        explicit UpdateSession(BookChapter & chapter);
        ~UpdateSession();
        UpdateSession(const UpdateSession &) = delete;
        UpdateSession & operator=(const UpdateSession &) = delete;

    private:
        BookChapter & m_Chapter;
    };

    /// An empty record, as `Load` expects it: cached start page 1, no endnotes (-1, -1), status `Ok`.
    BookChapter();
    /// A record for the file at `path`, named after it. Knows nothing of the document yet. Its cached start page is 0:
    /// if it comes to stand first before its file was ever opened, it takes that over as its start page, and so goes on
    /// from the chapter before like any record that nobody has looked into. It contains no index.
    explicit BookChapter(String const & path);
    ~BookChapter() override;

    [[nodiscard]] String GetName() const;
    /// Full path of the chapter's file: the key by which a chapter is found, compared byte for byte.
    [[nodiscard]] String GetPath() const;
    /// The chapter's path is this one. What look-ups by path ask every chapter of every book: it copies nothing.
    [[nodiscard]] bool HasPath(String const & path) const;
    /// Number of the document's first page as last seen.
    [[nodiscard]] int GetCachedStartPage() const;
    /// The page number that the chapter is fixed to, 0 if it goes on from the chapter before.
    [[nodiscard]] int GetStartFromPage() const;
    [[nodiscard]] bool IsContinueFromPrevious() const { return GetStartFromPage() == 0; }
    /// First endnote number of the chapter, -1 before the first update.
    [[nodiscard]] int GetEndnoteSequenceStart() const;
    /// The number that the next chapter's endnotes start with, -1 before the first update.
    [[nodiscard]] int GetEndnoteSequenceEnd() const;
    // A record whose document never opened says RGB, points, no bleed and single pages: what a new document has. There
    // are no spreads in it to which any of that would apply.
    [[nodiscard]] Raster::Format GetColourFormat() const;
    [[nodiscard]] Kernel::UnitValue::UnitType GetUnitType() const;
    [[nodiscard]] Kernel::Counted<Kernel::UnitValueConverter const> GetUnitConverter() const;
    [[nodiscard]] Kernel::Counted<const DocumentMetadata> GetMetadata() const;
    [[nodiscard]] Kernel::Consolidated<Raster::ICCProfile> GetProfile() const;
    [[nodiscard]] Raster::ICCManager::ICCProfileSet GetProfiles() const;
    /// Story of this chapter's endnotes, collected for the end of the book; may be null.
    [[nodiscard]] Kernel::Counted<Story::Story const> GetEndnotes() const;
    [[nodiscard]] PreflightResult::Status GetPreflightStatus() const;
    [[nodiscard]] String GetPreflightDescription() const;
    /// What the last check of the document found; null before the first. Not in the book file.
    [[nodiscard]] Kernel::Counted<PreflightResults const> GetPreflightResults() const;
    /// Modification time of the file when the book last looked.
    [[nodiscard]] Kernel::TimeStamp GetTimeStamp() const;
    /// One entry for each spread, in document order.
    [[nodiscard]] Snapshot<std::vector<SpreadInfo>> GetSpreadInfo() const;
    [[nodiscard]] Snapshot<std::vector<AnchorInfo>> GetAnchors() const;
    [[nodiscard]] bool HasBleed() const;
    [[nodiscard]] bool IsFacingPages() const;
    /// Facing pages lie one below the other instead of side by side.
    [[nodiscard]] bool IsVerticalStack() const;
    /// The chapter is the book's style source.
    [[nodiscard]] bool IsKey() const;
    [[nodiscard]] bool HasEndnotesMarker() const;
    [[nodiscard]] bool ContainsIndex() const;
    /// The document's owner forbids changes. Once learnt, this holds for the life of the record.
    [[nodiscard]] bool IsRestricted() const;
    /// The anchors are known to be stale; the list is then empty.
    [[nodiscard]] bool AreAnchorsDirty() const;
    /// The page range for display, such as "7 - 19".
    [[nodiscard]] String DescribePages() const;
    [[nodiscard]] Status GetStatus() const;
    /// The status as text, translated.
    [[nodiscard]] String GetStatusDescription() const;
    /// The text of any status value; empty for a number that is none.
    [[nodiscard]] static Kernel::LocalisedString DescribeStatus(Status status);
    /// Not restricted, and its file was there and could be opened: only such chapters take part in what needs
    /// documents.
    [[nodiscard]] bool IsValid() const;

    void SetName(String const & name);
    void SetPath(String const & path);
    void SetCachedStartPage(int page);
    void SetStartFromPage(int page);
    void SetColourFormat(Raster::Format format);
    void SetUnitType(Kernel::UnitValue::UnitType type);
    void SetUnitConverter(Kernel::Counted<Kernel::UnitValueConverter const> converter);
    void SetMetadata(Kernel::Counted<const DocumentMetadata> metadata);
    void SetProfile(Kernel::Consolidated<Raster::ICCProfile> profile);
    void SetProfiles(const Raster::ICCManager::ICCProfileSet & profiles);
    void SetHasBleed(bool hasBleed);
    void SetIsFacingPages(bool isFacingPages);
    void SetIsVerticalStack(bool isVerticalStack);
    void SetIsKey(bool isKey);
    void SetHasEndnotesMarker(bool hasMarker);
    void SetContainsIndex(bool containsIndex);
    void SetRestricted(bool restricted);
    void SetSpreadInfo(std::vector<SpreadInfo> const & spreads);
    /// The endnotes with the number they start at and the number after the last one.
    void SetEndnotes(Kernel::Counted<Story::Story const> endnotes, int start, int end);
    /// Replaces the list, and the anchors are no longer dirty.
    void SetAnchors(std::vector<AnchorInfo> const & anchors);
    /// Empties the list: nobody may take stale anchors for true ones.
    void SetAnchorsDirty();

    /// True if the status is another one than before.
    bool SetStatus(Status status);
    /// True if the text differs byte for byte.
    bool SetPages(String const & pages);
    /// Stores both. True only if both differ: a book does not become unsaved over a status whose text, which is what
    /// the user sees, stays the same.
    bool SetPreflightStatus(PreflightResult::Status status, String const & description);
    void SetPreflightResults(Kernel::Counted<PreflightResults const> results);
    /// Asks the file for its modification time. True if it gave one and that differs from the stored one, which it then
    /// replaces. A file that gives none leaves the field alone and counts as unchanged.
    bool UpdateTimeStamp();
    /// The same question without storing the answer.
    [[nodiscard]] bool WouldUpdateTimeStamp() const;

    /// Password of a protected source placed in the chapter, by its GUID; empty if none is known. Kept for the session
    /// only, never written.
    [[nodiscard]] String GetPassword(String guid) const;
    void SetPassword(String guid, String password);

    [[nodiscard]] int GetPageCount() const;
    [[nodiscard]] int GetExportingPageCount() const;
    [[nodiscard]] bool AllNonExporting() const;
    // For all walks see SpreadWalk.
    void GetFirstExportingSpreadAndPage(int & spread, int & page) const;
    void GetLastExportingSpreadAndPage(int & spread, int & page) const;
    /// Steps on from (spread, page); both become -1 behind the end.
    void GetNextExportingSpreadAndPage(int & spread, int & page) const;
    [[nodiscard]] bool IsDoublePageStart() const;
    [[nodiscard]] bool HasHangingPageEnd() const;
    /// The first page of this chapter can share a spread with the hanging last page of `previous`, which may be null.
    [[nodiscard]] bool CanMergeWithPrevious(Kernel::Counted<BookChapter const> previous) const;
    /// Blank pages, 0 to 2, needed before this chapter so that its pages fall on their own sides. None without a
    /// chapter before, without `padStrays`, or where merging is wanted and possible.
    [[nodiscard]] int GetPrePagePaddingCount(Kernel::Counted<BookChapter const> previous, bool padStrays,
                                             bool mergeStrays) const;

    /// Brackets a close of the chapter's document. Clearing it runs the function that a waiter left, under the lock of
    /// the bracket: the function must not ask this record about its close.
    void SetInClose(bool inClose) const;
    /// True if a close is running: then `onCloseFinished` is kept and will run once it ends, in place of any function
    /// that was kept before. False otherwise, and the function is dropped.
    bool IsInClose(std::function<void()> onCloseFinished) const;
    /// Lets one load at a time through the wait for a close, since the bracket remembers a single waiter. Hold it from
    /// the question to the end of the wait.
    [[nodiscard]] Kernel::CriticalSection const & GetCloseGate() const { return m_CloseGate; }

    /// Writes the seven persistent fields.
    void Save(Kernel::OutSerialiser & out) const override;
    /// Reads them; a missing one keeps what it had. Always true.
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;
    static Kernel::ClassProperties const & GetTypeClassProperties();
    static Kernel::Counted<Kernel::Serialisable> CreateObject();
    static Kernel::ClassProperties const ms_ClassProperties;

private:
    using Facts = std::shared_ptr<const ChapterFacts>;

    /// The facts that this thread has to see: its own draft inside an `UpdateSession`, else what is published.
    [[nodiscard]] Facts Now() const;
    /// Calls `change` on a copy of the facts, and publishes that unless a session will. Gives what `change` gives.
    template <typename TChange>
    auto Change(TChange const & change);

    Published<Facts> m_Facts;
    mutable std::recursive_mutex m_WriterLock;
    /// Not null while a session is open; touched under the writer lock only.
    std::shared_ptr<ChapterFacts> m_Draft;
    int m_SessionDepth = 0;
    std::atomic<std::thread::id> m_DraftOwner{};

    Kernel::CriticalSection m_PasswordsLock;
    std::map<String, String> m_Passwords;

    mutable bool m_InClose = false;
    Kernel::CriticalSection m_InCloseLock;
    mutable std::function<void()> m_OnCloseFinished;
    Kernel::CriticalSection m_CloseGate;
};

}
