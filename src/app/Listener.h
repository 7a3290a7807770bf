#pragma once

#include "app/Console.h"
#include "app/PasswordBook.h"
#include "framework/kernel/BroadcastNotification.h"
#include "import/Message.h"

#include <condition_variable>
#include <functional>
#include <memory>
#include <mutex>
#include <set>
#include <vector>

class DocumentPromptNotification;
class RequestPdfPasswordsNotification;
class ExportBookCompleteNotification;

namespace Book
{
class ChooseChapterFileNotification;
class ExportBookCompleteNotification;
class PromptFixBookPermissionsNotification;
}

namespace App
{

/// Puts a question to the user and reads the line that is typed; false if there is nobody to ask. Called on a delivery
/// thread, one question at a time.
using AskUser = std::function<bool(std::string const & question, std::string & answer)>;

/// Answers of the command line to questions that the book layer may ask.
struct StandingAnswers
{
    enum class Choice
    {
        Ask,
        Yes,
        No
    };
    /// Add documents of an older version, which are then brought up to date.
    Choice m_Upgrade = Choice::Ask;
    /// Look for chapters whose files are gone.
    Choice m_Locate = Choice::Ask;
    /// Passwords of placed files; null: none are known and nobody is asked.
    std::shared_ptr<PasswordBook> m_Passwords;
};

/// The program's ear: hears every notification of the process, shows progress, keeps what went wrong, answers
/// questions, and takes closed books out of the collection.
class Listener : public BroadcastNotificationSink
{
public:
    Listener(Console & console, AskUser ask, StandingAnswers answers);
    ~Listener() override;
    Listener(Listener const &) = delete;
    Listener & operator=(Listener const &) = delete;

    void Notify(Kernel::Counted<Kernel::Notification> notification) override;

    /// Messages that have come since the last call.
    [[nodiscard]] Import::MessageList TakeMessages();
    /// The last export's end; null before it is heard.
    [[nodiscard]] Kernel::Counted<Book::ExportBookCompleteNotification const> GetExport() const;
    /// The last save of a book went well; false before any was heard.
    [[nodiscard]] bool WasSaved() const;
    /// Forgets exports and saves that were heard.
    void Forget();
    /// What is answered from now on without asking. Not while a question is open.
    void SetAnswers(StandingAnswers answers);

private:
    void AnswerPrompt(DocumentPromptNotification const & prompt);
    void AnswerFile(Book::ChooseChapterFileNotification const & prompt);
    void AnswerPasswords(RequestPdfPasswordsNotification const & request);
    void AnswerPermission(Book::PromptFixBookPermissionsNotification const & prompt);
    void Add(Import::Severity severity, char const * kind, std::string const & file, std::string const & text);
    /// Asks, or says which option would have answered.
    bool Ask(std::string const & question, char const * option, std::string & answer);

    Console & m_Console;
    AskUser m_Ask;
    StandingAnswers m_Answers;
    mutable std::mutex m_Lock;
    Import::MessageList m_Messages;
    Kernel::Counted<Book::ExportBookCompleteNotification const> m_Export;
    bool m_WasSaved = false;
    /// The user had no file to name: the question whether to look on is answered with no.
    bool m_HasGivenUp = false;
    /// Protected files that were told of; each load asks for their passwords again.
    std::set<std::string> m_ToldLocked;
};

}
