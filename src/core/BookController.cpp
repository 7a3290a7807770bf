#include "core/BookController.h"

#include "core/UpdateChaptersTask.h"
#include "framework/document/DocumentController.h"
#include "framework/document/PDFBookmarkManager.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/Path.h"
#include "framework/raster/DynamicBitmap.h"
#include "framework/render/FileExportOptions.h"
#include "framework/story/AnchorData.h"
#include "framework/story/Index.h"

#include <algorithm>
#include <iterator>

namespace Book
{

namespace
{

constexpr int FullPassInterval = 100;
constexpr int ForegroundPassInterval = 1000;

/// Where the chapter stands in the list; the end if it does not, or is null.
template <typename TList>
auto Find(TList & chapters, Kernel::Counted<BookChapter const> const & chapter)
{
    return std::find_if(chapters.begin(), chapters.end(),
                        [&](const auto & entry) { return entry && entry == chapter; });
}

/// An entry of the list is null where the book file held something else.
bool IsChapter(Kernel::Counted<BookChapter> const & entry)
{
    return static_cast<bool>(entry);
}

/// The first chapter that the test holds for, or null.
template <typename TTest>
Kernel::Counted<BookChapter> FindFirst(const Snapshot<BookController::ChapterList> & chapters, const TTest & test)
{
    const auto found =
        std::find_if(chapters.begin(), chapters.end(),
                     [&](Kernel::Counted<BookChapter> const & chapter) { return chapter && test(*chapter); });
    return found == chapters.end() ? nullptr : *found;
}

Kernel::Counted<BookChapter> FirstOf(const Snapshot<BookController::ChapterList> & chapters)
{
    return FindFirst(chapters, [](BookChapter const &) { return true; });
}

}

BookController::BookController() = default;
BookController::~BookController() = default;

template <typename TChange>
void BookController::ChangeChapters(const TChange & change)
{
    ChapterList chapters = *Chapters();
    change(chapters);
    m_Chapters.Set(Snapshot(std::move(chapters)));
}

int BookController::ChapterCount() const
{
    return static_cast<int>(Chapters().size());
}

bool BookController::HasChapters() const
{
    return !Chapters().empty();
}

BookController::ChapterList::const_iterator BookController::ChapterBegin() const
{
    return Chapters().begin();
}

BookController::ChapterList::const_iterator BookController::ChapterEnd() const
{
    return Chapters().end();
}

Kernel::JailCounted<BookChapter> BookController::GetChapterAtIndex(int index)
{
    const Snapshot<ChapterList> chapters = Chapters();
    return index < 0 || index >= static_cast<int>(chapters.size()) ? nullptr
                                                                   : chapters[static_cast<std::size_t>(index)];
}

Kernel::Counted<BookChapter const> BookController::GetChapterAtIndex(int index) const
{
    return const_cast<BookController *>(this)->GetChapterAtIndex(index);
}

int BookController::IndexFromChapter(Kernel::Counted<BookChapter const> chapter) const
{
    const Snapshot<ChapterList> chapters = Chapters();
    const auto found = Find(*chapters, chapter);
    return found == chapters.end() ? -1 : static_cast<int>(found - chapters.begin());
}

Kernel::Counted<BookChapter const> BookController::GetNextChapter(Kernel::Counted<BookChapter const> chapter) const
{
    const Snapshot<ChapterList> chapters = Chapters();
    const auto found = Find(*chapters, chapter);
    const auto next = found == chapters.end() ? found : std::find_if(found + 1, chapters.end(), IsChapter);
    return next == chapters.end() ? nullptr : *next;
}

Kernel::Counted<BookChapter const> BookController::GetPreviousChapter(Kernel::Counted<BookChapter const> chapter) const
{
    const Snapshot<ChapterList> chapters = Chapters();
    const auto found = Find(*chapters, chapter);
    if (found == chapters.end()) {
        return nullptr;
    }
    const auto previous = std::find_if(std::make_reverse_iterator(found), chapters->rend(), IsChapter);
    return previous == chapters->rend() ? nullptr : *previous;
}

void BookController::GetChapters(ConstChapterList & chapters) const
{
    const Snapshot<ChapterList> all = Chapters();
    std::copy_if(all.begin(), all.end(), std::back_inserter(chapters), IsChapter);
}

void BookController::GetChaptersAfter(ConstChapterList & chapters, Kernel::Counted<BookChapter const> chapter) const
{
    const Snapshot<ChapterList> all = Chapters();
    const auto found = Find(*all, chapter);
    if (found != all.end()) {
        std::copy_if(found + 1, all.end(), std::back_inserter(chapters), IsChapter);
    }
}

Kernel::Counted<BookChapter> BookController::GetMutableChapter(Kernel::Counted<BookChapter const> chapter) const
{
    const Snapshot<ChapterList> chapters = Chapters();
    const auto found = Find(*chapters, chapter);
    return found == chapters.end() ? nullptr : *found;
}

Kernel::Counted<BookChapter> BookController::GetChapterFromPath(String const & path)
{
    return FindFirst(Chapters(), [&](BookChapter const & chapter) { return chapter.HasPath(path); });
}

Kernel::Counted<BookChapter const> BookController::GetChapterFromPath(String const & path) const
{
    return const_cast<BookController *>(this)->GetChapterFromPath(path);
}

bool BookController::ContainsChapter(String const & path) const
{
    return static_cast<bool>(GetChapterFromPath(path));
}

bool BookController::ContainsValidChapters() const
{
    return static_cast<bool>(FindFirst(Chapters(), [](BookChapter const & chapter) { return chapter.IsValid(); }));
}

bool BookController::ContainsEstrangedChapters() const
{
    return static_cast<bool>(FindFirst(Chapters(), [](BookChapter const & chapter) {
        return chapter.GetStatus() == BookChapter::Status::OpenForEdit &&
               !VantraController::GetInstance().GetRegisteredDocumentControllerFromPath(chapter.GetPath());
    }));
}

Kernel::Counted<BookChapter const> BookController::GetChapterWithIndex() const
{
    return FindFirst(Chapters(), [](BookChapter const & chapter) { return chapter.ContainsIndex(); });
}

Kernel::Counted<BookChapter const> BookController::GetChapterWithEndnotesMarker() const
{
    return FindFirst(Chapters(), [](BookChapter const & chapter) { return chapter.HasEndnotesMarker(); });
}

bool BookController::HasEndnotesMarker() const
{
    return static_cast<bool>(GetChapterWithEndnotesMarker());
}

Kernel::Counted<BookChapter> BookController::AddChapter(String const & path, int index)
{
    if (ContainsChapter(path)) {
        return nullptr;
    }
    const auto chapter = Kernel::MakeCounted<BookChapter>(path);
    ChangeChapters([&](ChapterList & chapters) {
        bool const inside = index >= 0 && index < static_cast<int>(chapters.size());
        chapters.insert(inside ? chapters.begin() + index : chapters.end(), chapter);
    });
    if (ChapterCount() == 1) {
        chapter->SetIsKey(true);
    }
    UpdateChapterStatus(chapter, nullptr, true, true);
    if (const auto document = VantraController::GetInstance().GetRegisteredDocumentControllerFromPath(path)) {
        ReconcileIndex(document);
    }
    MarkChanged();
    return chapter;
}

void BookController::RemoveChapters(const ConstChapterList & chapters)
{
    for (Kernel::Counted<BookChapter const> const & chapter : chapters) {
        if (!chapter || IndexFromChapter(chapter) < 0) {
            continue;
        }
        ChangeChapters([&](ChapterList & list) { list.erase(Find(list, chapter)); });
        MarkChanged();
        if (chapter->IsKey()) {
            m_Thumbnail.Set(nullptr);
            if (const Kernel::Counted<BookChapter> first = FirstOf(Chapters())) {
                SetKeyChapter(first);
            }
        }
    }
    OnFirstChapterChanged();
}

Kernel::Counted<BookChapter> BookController::ReplaceChapter(Kernel::Counted<BookChapter const> old, String const & path)
{
    const int index = IndexFromChapter(old);
    if (index < 0) {
        return nullptr;
    }
    const auto chapter = Kernel::MakeCounted<BookChapter>(path);
    chapter->SetIsKey(old->IsKey());
    ChangeChapters([&](ChapterList & chapters) { chapters[static_cast<std::size_t>(index)] = chapter; });
    UpdateChapterStatus(chapter, nullptr, true, false);
    MarkChanged();
    return chapter;
}

void BookController::MoveChapters(Kernel::Counted<BookChapter const> before, ConstChapterList chapters)
{
    ChapterList rest = *Chapters();
    ChapterList moved;
    const Kernel::Counted<BookChapter> oldFirst = FirstOf(Chapters());
    for (Kernel::Counted<BookChapter const> const & chapter : chapters) {
        const auto found = Find(rest, chapter);
        if (found == rest.end()) {
            return;
        }
        moved.push_back(*found);
        rest.erase(found);
    }
    rest.insert(Find(rest, before), moved.begin(), moved.end());
    m_Chapters.Set(Snapshot(std::move(rest)));

    const Kernel::Counted<BookChapter> first = FirstOf(Chapters());
    if (first && oldFirst && !(first == oldFirst) && oldFirst->GetStartFromPage() == 1) {
        first->SetStartFromPage(1);
        oldFirst->SetStartFromPage(0);
    }
    MarkChanged();
}

void BookController::OnFirstChapterChanged()
{
    if (const Kernel::Counted<BookChapter> first = FirstOf(Chapters())) {
        first->SetStartFromPage(first->GetCachedStartPage());
    }
}

Kernel::JailCounted<BookChapter> BookController::GetKeyChapter(bool fallBack)
{
    const Snapshot<ChapterList> chapters = Chapters();
    const Kernel::Counted<BookChapter> key =
        FindFirst(chapters, [](BookChapter const & chapter) { return chapter.IsKey() && chapter.IsValid(); });
    if (key || !fallBack) {
        return key;
    }
    return FindFirst(chapters, [](BookChapter const & chapter) { return chapter.IsValid(); });
}

Kernel::Counted<BookChapter const> BookController::GetKeyChapter(bool fallBack) const
{
    return const_cast<BookController *>(this)->GetKeyChapter(fallBack);
}

bool BookController::HasValidKeyChapter() const
{
    const Kernel::Counted<BookChapter const> key = GetKeyChapter(true);
    return key && key->IsValid();
}

void BookController::SetKeyChapter(Kernel::Counted<BookChapter const> chapter)
{
    if (const Kernel::Counted<BookChapter> old = GetKeyChapter(true)) {
        old->SetIsKey(false);
    }
    m_Thumbnail.Set(nullptr);
    if (const Kernel::Counted<BookChapter> key = GetMutableChapter(chapter)) {
        key->SetIsKey(true);
        UpdateChapterStatus(key, nullptr, false, false);
    }
    MarkChanged();
}

BookController::SynchroniseSettings BookController::GetSynchroniseSettings() const
{
    return m_SynchroniseSettings.Get();
}

void BookController::SetSynchroniseSettings(const SynchroniseSettings & settings)
{
    m_SynchroniseSettings.Set(settings);
}

Kernel::Consolidated<Renderer::FileExportOptions> BookController::GetExportOptions() const
{
    return m_ExportOptions.Get();
}

void BookController::SetExportOptions(Kernel::Consolidated<Renderer::FileExportOptions> options)
{
    m_ExportOptions.Set(std::move(options));
    MarkChanged();
}

Kernel::Counted<PDFBookmarkManager const> BookController::GetPDFBookmarks() const
{
    return m_PDFBookmarks.Get();
}

Kernel::Counted<Raster::DynamicBitmap const> BookController::GetThumbnail() const
{
    return m_Thumbnail.Get();
}

void BookController::UpdateThumbnail(Kernel::Counted<Raster::DynamicBitmap const> thumbnail)
{
    m_Thumbnail.Set(std::move(thumbnail));
}

Kernel::Counted<Story::Index const> BookController::GetMasterIndex() const
{
    return m_MasterIndex.Get();
}

String BookController::GetPath() const
{
    return m_Path.Get();
}

void BookController::SetPath(String const & path)
{
    m_Path.Set(path);
}

String BookController::GetName(int number, bool markModified) const
{
    String name = Kernel::Path::GetFileNameWithoutExtension(GetPath());
    if (name.Empty()) {
        name = number == 1 ? Kernel::LocalisedString("Untitled", "Book Title").ToString()
                           : Kernel::Format(Kernel::LocalisedString("Untitled %1", "Book Title"), number);
    }
    if (IsDirty() && markModified) {
        name = Kernel::Format(Kernel::LocalisedString("%1 [Modified]", "Book Status"), name);
    }
    return name;
}

void BookController::SetIsDirty(bool dirty)
{
    if (dirty) {
        MarkChanged();
    } else {
        m_SavedChanges = m_Changes.load();
    }
}

bool BookController::CanSave() const
{
    return IsDirty() || GetPath().Empty();
}

void BookController::NewBook()
{
    StartBackgroundTaskPump();
}

void BookController::UpdateChapters()
{
    if (const auto task = m_UpdateChaptersTask.Get()) {
        task->Dirty();
    }
}

void BookController::UpdateForegroundChapters()
{
    if (const auto task = m_UpdateForegroundChaptersTask.Get()) {
        task->Dirty();
    }
}

void BookController::OnUpdateChaptersComplete()
{
    if (const auto task = m_UpdateChaptersTask.Get()) {
        task->Clean();
    }
}

void BookController::OnUpdateForegroundChaptersComplete()
{
    if (const auto task = m_UpdateForegroundChaptersTask.Get()) {
        task->Clean();
    }
}

void BookController::StartBackgroundTaskPump()
{
    const auto all = Kernel::MakeCounted<UpdateChaptersTask>(FullPassInterval, true, true, false);
    m_UpdateChaptersTask.Set(all);
    AddBackgroundTask(all);
    const auto foreground = Kernel::MakeCounted<UpdateChaptersTask>(ForegroundPassInterval, false, true, true);
    m_UpdateForegroundChaptersTask.Set(foreground);
    AddBackgroundTask(foreground);
    SetWantBackgroundTasks(true);
    DomainController::StartBackgroundTaskPump();
}

}
