#include "core/BookController.h"
#include "core/BookNotification.h"
#include "core/ChapterFileNotifications.h"
#include "documents/ChapterFileState.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/File.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Path.h"

#include <algorithm>

namespace Book
{

ChapterFileState ProbeChapterFile(String const & path)
{
    Kernel::File file;
    switch (static_cast<int>(
        file.OpenEx(path.c_str(), "rb", Kernel::File::ShareMode::Shared, Kernel::File::VisibilityMode::Normal))) {
    case 0:
    case 1:
        return ChapterFileState::CanBeOpened;
    case 5:
    case 7:
    case 8:
    case 9:
        return ChapterFileState::Busy;
    case 6:
        return ChapterFileState::AccessDenied;
    default:
        return ChapterFileState::OtherFailure;
    }
}

namespace
{

/// The beginnings in which two paths of one file differ: what is left of each without the end that they share, the
/// first character that differs included. Empty if one path is the end of the other.
std::pair<String, String> DifferingPrefixes(String const & oldPath, String const & newPath)
{
    std::string_view const a = oldPath.View();
    std::string_view const b = newPath.View();
    auto const [i, j] = std::mismatch(a.rbegin(), a.rend(), b.rbegin(), b.rend());
    if (i == a.rend() || j == b.rend()) {
        return {};
    }
    return {String(a.substr(0, static_cast<std::size_t>(a.rend() - i))),
            String(b.substr(0, static_cast<std::size_t>(b.rend() - j)))};
}

void BroadcastChange(Kernel::Counted<BookController const> const & book, Kernel::Counted<BookChapter> const & chapter)
{
    VantraController::GetInstance().Broadcast(
        Kernel::MakeCounted<ChapterChangedNotification>(book, Kernel::Counted<BookChapter const>(chapter)));
}

}

void BookController::CollateMissingChapters()
{
    for (Kernel::Counted<BookChapter> const & chapter : Chapters()) {
        ChapterFileState const state = chapter ? ProbeChapterFile(chapter->GetPath()) : ChapterFileState::CanBeOpened;
        if (state == ChapterFileState::CanBeOpened) {
            continue;
        }
        m_MissingChapters.push_back(chapter);
        if (state == ChapterFileState::AccessDenied) {
            m_ForbiddenChapter = chapter;
        }
    }
    NotifyMissingChapters();
}

void BookController::NotifyMissingChapters()
{
    std::erase_if(m_MissingChapters,
                  [this](Kernel::Counted<BookChapter> const & chapter) { return IndexFromChapter(chapter) < 0; });
    if (m_ForbiddenChapter && IndexFromChapter(m_ForbiddenChapter) < 0) {
        m_ForbiddenChapter = nullptr;
    }
    if (m_MissingChapters.empty()) {
        return;
    }
    VantraController & application = VantraController::GetInstance();
    Kernel::Counted<BookController> const book(this);
    if (!m_ForbiddenChapter || !application.CanAskForFilePermission()) {
        application.Broadcast(Kernel::MakeCounted<PromptMissingChapterFileNotification>(book));
    } else {
        application.Broadcast(Kernel::MakeCounted<PromptFixBookPermissionsNotification>(book, m_ForbiddenChapter));
    }
}

void BookController::RespondMissingChapterPrompt(bool locate)
{
    if (!locate) {
        return;
    }
    Snapshot<ChapterList> const chapters = Chapters();
    auto const missing = std::find_if(chapters.begin(), chapters.end(), [](auto const & chapter) {
        return chapter && !Kernel::FileSystem::Exists(chapter->GetPath());
    });
    if (missing != chapters.end()) {
        VantraController::GetInstance().Broadcast(Kernel::MakeCounted<LocateMissingChapterFileNotification>(
            (*missing)->GetPath(), Kernel::Counted<BookController>(this)));
    }
}

void BookController::ResolveMissingChapters(String oldPath, String newPath)
{
    if (!newPath.Empty()) {
        String const oldName = Kernel::Path::GetFileName(oldPath);
        if (!(oldName == Kernel::Path::GetFileName(newPath))) {
            // The right folder and another file: the one of the same name counts, if it is there.
            String const candidate = Kernel::Path::GetFolderWithSeparator(newPath) + oldName;
            if (Kernel::FileSystem::Exists(candidate)) {
                newPath = candidate;
            }
        }
        auto const [oldPrefix, newPrefix] = DifferingPrefixes(oldPath, newPath);
        if (!oldPrefix.Empty()) {
            m_ChapterPathChanges.emplace_back(oldPrefix, newPrefix);
        }
        ChapterList stillMissing;
        for (Kernel::Counted<BookChapter> const & chapter : m_MissingChapters) {
            String path = newPath;
            if (!ResolveChapterFilePath(oldPath, path, chapter)) {
                stillMissing.push_back(chapter);
                continue;
            }
            chapter->SetPath(path);
            if (ProbeChapterFile(path) == ChapterFileState::AccessDenied) {
                stillMissing.push_back(chapter);
                if (!m_ForbiddenChapter) {
                    m_ForbiddenChapter = chapter;
                }
                continue;
            }
            UpdateChapterStatus(chapter, nullptr, false, false);
            BroadcastChange(Kernel::Counted<BookController const>(this), chapter);
        }
        m_MissingChapters = std::move(stillMissing);
    }
    NotifyMissingChapters();
}

bool BookController::ResolveChapterFilePath(String oldPath, String & newPath,
                                            Kernel::Counted<BookChapter> chapter) const
{
    String const path = chapter->GetPath();
    if (path == oldPath) {
        return true;
    }
    for (auto const & [oldPrefix, newPrefix] : m_ChapterPathChanges) {
        if (!path.View().starts_with(oldPrefix.View())) {
            continue;
        }
        String const candidate = newPrefix + path.View().substr(oldPrefix.Length());
        if (Kernel::FileSystem::Exists(candidate)) {
            newPath = candidate;
            return true;
        }
    }
    return false;
}

void BookController::RetryFilePermissions(bool ignoreAll)
{
    m_ForbiddenChapter = nullptr;
    ChapterList stillMissing;
    for (Kernel::Counted<BookChapter> const & chapter : m_MissingChapters) {
        ChapterFileState const state = ProbeChapterFile(chapter->GetPath());
        if (state == ChapterFileState::CanBeOpened) {
            UpdateChapterStatus(chapter, nullptr, false, false);
            BroadcastChange(Kernel::Counted<BookController const>(this), chapter);
            continue;
        }
        stillMissing.push_back(chapter);
        if (state == ChapterFileState::AccessDenied && !ignoreAll && !m_ForbiddenChapter) {
            m_ForbiddenChapter = chapter;
        }
    }
    m_MissingChapters = std::move(stillMissing);
    NotifyMissingChapters();
}

void BookController::IgnoreFilePermissions(Kernel::Counted<BookChapter const> const & chapter)
{
    std::erase_if(m_MissingChapters, [&](Kernel::Counted<BookChapter> const & entry) { return entry == chapter; });
    RetryFilePermissions(false);
}

void BookController::IgnoreAllFilePermissions()
{
    RetryFilePermissions(true);
}

}
