#pragma once

#include "core/BookNotification.h"
#include "framework/document/DocumentPromptNotification.h"

namespace Book
{

/// Asks the front end for a file.
class ChooseChapterFileNotification : public BookNotification
{
public:
    ChooseChapterFileNotification(String title, String currentPath, Kernel::Counted<const BookController> book);

    [[nodiscard]] String GetTitle() const { return m_Title; }
    [[nodiscard]] String GetCurrentPath() const { return m_CurrentPath; }
    /// The front end's answer: the chosen path, empty if the user cancelled. Nothing here.
    virtual void ProcessResponse(String path) const;

private:
    String m_Title;
    String m_CurrentPath;
};

/// Asks where the file of a missing chapter has gone. The answer goes to `BookController::ResolveMissingChapters`, as a
/// turn of the book's queue.
class LocateMissingChapterFileNotification final : public ChooseChapterFileNotification
{
public:
    LocateMissingChapterFileNotification(String path, Kernel::Counted<BookController> book);
    void ProcessResponse(String path) const override;

private:
    Kernel::Counted<BookController> m_MutableBook;
};

/// Asks whether the user wants to look for the missing chapters.
class PromptMissingChapterFileNotification final : public DocumentPromptNotification
{
public:
    explicit PromptMissingChapterFileNotification(Kernel::Counted<const BookController> book);

    /// No.
    [[nodiscard]] DocumentPromptChoice GetDefaultChoice() const override;
    void ProcessChoice(DocumentPromptChoice choice) override;
};

/// Asks the user to let the program at a chapter's file. The front end ends in `Ignore`, `IgnoreAll` or `Retry`.
class PromptFixBookPermissionsNotification final : public BookNotification
{
public:
    PromptFixBookPermissionsNotification(Kernel::Counted<BookController> book,
                                         Kernel::Counted<const BookChapter> chapter);

    [[nodiscard]] String GetPath() const { return m_Chapter->GetPath(); }
    [[nodiscard]] String GetChapterPath() const { return m_Chapter->GetPath(); }
    /// Gives up on this chapter, and tries the others again.
    void Ignore();
    /// Stops asking for permission.
    void IgnoreAll();
    /// Tries again.
    void Retry(bool ignoreAll);
    [[nodiscard]] Kernel::LocalisedString GetTitle() const;
    /// With "%@" where the front end puts the path.
    [[nodiscard]] Kernel::LocalisedString GetMessage() const;

private:
    Kernel::Counted<BookController> m_MutableBook;
    Kernel::Counted<const BookChapter> m_Chapter;
};

}
