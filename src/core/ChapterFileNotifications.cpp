#include "core/ChapterFileNotifications.h"

namespace Book
{

ChooseChapterFileNotification::ChooseChapterFileNotification(String title, String currentPath,
                                                             Kernel::Counted<BookController const> book)
    : BookNotification(book),
      m_Title(std::move(title)),
      m_CurrentPath(std::move(currentPath))
{
}

void ChooseChapterFileNotification::ProcessResponse(String) const {}

LocateMissingChapterFileNotification::LocateMissingChapterFileNotification(String path,
                                                                           Kernel::Counted<BookController> book)
    : ChooseChapterFileNotification(Kernel::LocalisedString("Locate missing chapter", "Missing chapter"),
                                    std::move(path), book),
      m_MutableBook(book),
      m_Question(book, [] {})
{
}

void LocateMissingChapterFileNotification::ProcessResponse(String path) const
{
    m_Question.Answer(
        [book = m_MutableBook, oldPath = GetCurrentPath(), path] { book->ResolveMissingChapters(oldPath, path); });
}

PromptMissingChapterFileNotification::PromptMissingChapterFileNotification(Kernel::Counted<BookController> book)
    : DocumentPromptNotification(
          Kernel::LocalisedString("Missing Chapters(s)", "Missing Chapter Notification"),
          Kernel::LocalisedString("Some of your chapter files are missing. Would you like to locate them?",
                                  "Missing Chapter Notification"),
          static_cast<DocumentPromptChoice>(PromptYes | PromptNo), PromptIconQuestion, {},
          [book](DocumentPromptChoice choice) { book->RespondMissingChapterPrompt(choice == PromptYes); }, book)
{
}

DocumentPromptChoice PromptMissingChapterFileNotification::GetDefaultChoice() const
{
    return PromptNo;
}

void PromptMissingChapterFileNotification::ProcessChoice(DocumentPromptChoice choice) const
{
    Answer(choice);
}

PromptFixBookPermissionsNotification::PromptFixBookPermissionsNotification(Kernel::Counted<BookController> book,
                                                                           Kernel::Counted<BookChapter const> chapter)
    : BookNotification(book),
      m_MutableBook(book),
      m_Chapter(std::move(chapter)),
      m_Question(book, [] {})
{
}

void PromptFixBookPermissionsNotification::Ignore() const
{
    m_Question.Answer([book = m_MutableBook, chapter = m_Chapter] { book->IgnoreFilePermissions(chapter); });
}

void PromptFixBookPermissionsNotification::IgnoreAll() const
{
    m_Question.Answer([book = m_MutableBook] { book->IgnoreAllFilePermissions(); });
}

void PromptFixBookPermissionsNotification::Retry(bool ignoreAll) const
{
    m_Question.Answer([book = m_MutableBook, ignoreAll] { book->RetryFilePermissions(ignoreAll); });
}

Kernel::LocalisedString PromptFixBookPermissionsNotification::GetTitle() const
{
    return Kernel::LocalisedString("Chapter permission denied", "File permissions warning");
}

Kernel::LocalisedString PromptFixBookPermissionsNotification::GetMessage() const
{
    return Kernel::LocalisedString(
        "Permission to access the following file has been denied:\n\n%@\n\nPlease grant permission to the access the "
        "chapter. We recommend granting global permission to avoid future requests.",
        "File permissions warning");
}

}
