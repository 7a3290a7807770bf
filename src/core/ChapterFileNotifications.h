#pragma once

#include "core/BookNotification.h"
#include "framework/document/DocumentPromptNotification.h"
#include "framework/kernel/Question.h"

namespace Book
{

/// Asks the front end for a file.
class ChooseChapterFileNotification : public BookNotification
{
public:
    ChooseChapterFileNotification(String title, String currentPath, Kernel::Counted<BookController const> book);

    [[nodiscard]] String GetTitle() const { return m_Title; }
    [[nodiscard]] String GetCurrentPath() const { return m_CurrentPath; }
    /// The front end's answer: the chosen path, empty if the user cancelled. Nothing here.
    virtual void ProcessResponse(String path) const;

private:
    String m_Title;
    String m_CurrentPath;
};

/// Asks where the file of a missing chapter has gone. The answer goes to `BookController::ResolveMissingChapters`, as a
/// turn of the book's queue; the first one counts.
class LocateMissingChapterFileNotification final : public ChooseChapterFileNotification
{
public:
    LocateMissingChapterFileNotification(String path, Kernel::Counted<BookController> book);
    void ProcessResponse(String path) const override;

protected:
    void OnPassedEveryLine() override { m_Question.MarkAsked(); }

private:
    Kernel::Counted<BookController> m_MutableBook;
    Kernel::Question m_Question;
};

/// Asks whether the user wants to look for the missing chapters.
class PromptMissingChapterFileNotification : public DocumentPromptNotification
{
public:
    explicit PromptMissingChapterFileNotification(Kernel::Counted<BookController> book);

    /// What is taken where nobody can be asked: no.
    [[nodiscard]] virtual DocumentPromptChoice GetDefaultChoice() const;
    /// The front end's answer, which `BookController::RespondMissingChapterPrompt` gets as a turn of the book's queue;
    /// the first one counts.
    virtual void ProcessChoice(DocumentPromptChoice choice) const;
};

/// Asks the user to let the program at a chapter's file. The front end ends in `Ignore`, `IgnoreAll` or `Retry`, of
/// which the first counts; it runs as a turn of the book's queue.
class PromptFixBookPermissionsNotification final : public BookNotification
{
public:
    PromptFixBookPermissionsNotification(Kernel::Counted<BookController> book,
                                         Kernel::Counted<BookChapter const> chapter);

    [[nodiscard]] String GetPath() const { return m_Chapter->GetPath(); }
    [[nodiscard]] String GetChapterPath() const { return m_Chapter->GetPath(); }
    /// Gives up on this chapter, and tries the others again.
    void Ignore() const;
    /// Stops asking for permission.
    void IgnoreAll() const;
    /// Tries again.
    void Retry(bool ignoreAll) const;
    [[nodiscard]] Kernel::LocalisedString GetTitle() const;
    /// With "%@" where the front end puts the path.
    [[nodiscard]] Kernel::LocalisedString GetMessage() const;

protected:
    void OnPassedEveryLine() override { m_Question.MarkAsked(); }

private:
    Kernel::Counted<BookController> m_MutableBook;
    Kernel::Counted<BookChapter const> m_Chapter;
    Kernel::Question m_Question;
};

}
