#include "app/Listener.h"

#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "core/BookSavedNotification.h"
#include "core/ChapterFileNotifications.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/document/DocumentPromptNotification.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/document/RequestPdfPasswordsNotification.h"
#include "framework/kernel/CommandNotifications.h"
#include "framework/kernel/DataSource.h"
#include "import/SaveFailure.h"
#include "import/Text.h"
#include "output/ExportBookCompleteNotification.h"

#include <algorithm>
#include <filesystem>

namespace App
{

using Import::Text;

namespace
{

bool IsYes(std::string const & answer)
{
    return "y" == answer || "Y" == answer || "yes" == answer || Text("y", "Question") == answer ||
           Text("yes", "Question") == answer;
}

}

Listener::Listener(Console & console, AskUser ask, StandingAnswers answers)
    : m_Console(console),
      m_Ask(std::move(ask)),
      m_Answers(answers)
{
    BroadcastNotification::RegisterBroadcastSink(this);
}

Listener::~Listener()
{
    BroadcastNotification::UnregisterBroadcastSink(this);
}

void Listener::Add(Import::Severity severity, char const * kind, std::string const & file, std::string const & text)
{
    std::lock_guard const lock(m_Lock);
    m_Messages.Add(severity, kind, {file}, text);
}

Import::MessageList Listener::TakeMessages()
{
    std::lock_guard const lock(m_Lock);
    return std::exchange(m_Messages, {});
}

Kernel::Counted<Book::ExportBookCompleteNotification const> Listener::GetExport() const
{
    std::lock_guard const lock(m_Lock);
    return m_Export;
}

bool Listener::WasSaved() const
{
    std::lock_guard const lock(m_Lock);
    return m_WasSaved;
}

void Listener::Forget()
{
    std::lock_guard const lock(m_Lock);
    m_Export.Reset();
    m_WasSaved = false;
}

void Listener::SetAnswers(StandingAnswers answers)
{
    std::lock_guard const lock(m_Lock);
    m_Answers = answers;
}

void Listener::Notify(Kernel::Counted<Kernel::Notification> notification)
{
    using Import::Severity;
    Kernel::Notification const * const heard = notification.Get();
    if (auto const * progress = dynamic_cast<CommandProgressNotification const *>(heard)) {
        m_Console.Progress(progress->GetDescription().ToStd(), progress->GetFraction());
    } else if (auto const * closed = dynamic_cast<Book::BookClosedNotification const *>(heard)) {
        Book::BookCollection::GetInstance().RemoveBookController(closed->GetBookController());
    } else if (auto const * saved = dynamic_cast<Book::BookSavedNotification const *>(heard)) {
        if (!saved->GetResult().IsSuccess()) {
            Add(Severity::Error, "book-unsaved", saved->GetPath().ToStd(),
                Import::DescribeSaveFailure(saved->GetResult(), saved->GetPath().ToStd()));
        }
        std::lock_guard const lock(m_Lock);
        m_WasSaved = saved->GetResult().IsSuccess();
    } else if (auto const * exported = dynamic_cast<Book::ExportBookCompleteNotification const *>(heard)) {
        std::lock_guard const lock(m_Lock);
        m_Export = Kernel::Counted<Book::ExportBookCompleteNotification const>(exported);
    } else if (auto const * failed = dynamic_cast<OpenDocumentFailedNotification const *>(heard)) {
        for (String const & warning : failed->GetWarnings()) {
            Add(Severity::Warning, "document-warning", failed->GetPath().ToStd(), warning.ToStd());
        }
        if (OpenDocumentFailedNotification::Success != failed->GetResult()) {
            Add(Severity::Error, "document-unreadable", failed->GetPath().ToStd(), failed->GetReason().ToStd());
        }
    } else if (auto const * broken = dynamic_cast<CommandFailedNotification const *>(heard)) {
        Add(Severity::Error, "command-failed", "",
            Text("%1 failed: %2", "Program", broken->GetDescription(), broken->GetReason()));
    } else if (auto const * lost = dynamic_cast<DocumentSaveFailedNotification const *>(heard)) {
        std::string const kept = lost->GetKeptPath().Empty()
                                     ? Text("Nor could its changes be kept anywhere else: they are lost.", "Program")
                                     : Text("Its changed content is kept in %1.", "Program", lost->GetKeptPath());
        Add(Severity::Error, "document-unsaved", lost->GetPath().ToStd(), lost->GetReason().ToStd() + " " + kept);
    } else if (auto const * permission = dynamic_cast<Book::PromptFixBookPermissionsNotification const *>(heard)) {
        AnswerPermission(*permission);
    } else if (auto const * file = dynamic_cast<Book::ChooseChapterFileNotification const *>(heard)) {
        AnswerFile(*file);
    } else if (auto const * prompt = dynamic_cast<DocumentPromptNotification const *>(heard)) {
        AnswerPrompt(*prompt);
    } else if (auto const * passwords = dynamic_cast<RequestPdfPasswordsNotification const *>(heard)) {
        AnswerPasswords(*passwords);
    }
}

bool Listener::Ask(std::string const & question, char const * option, std::string & answer)
{
    if (m_Ask && m_Ask(question, answer)) {
        return true;
    }
    Add(Import::Severity::Warning, "unanswered", "",
        question + " " +
            Text("Nobody can be asked here, so the answer is no; %1 answers it beforehand.", "Program", option));
    return false;
}

void Listener::AnswerPrompt(DocumentPromptNotification const & prompt)
{
    bool const isMissing = nullptr != dynamic_cast<Book::PromptMissingChapterFileNotification const *>(&prompt);
    StandingAnswers::Choice standing = StandingAnswers::Choice::No;
    if (std::lock_guard const lock(m_Lock); !isMissing || !std::exchange(m_HasGivenUp, false)) {
        standing = isMissing ? m_Answers.m_Locate : m_Answers.m_Upgrade;
    }
    bool isYes = StandingAnswers::Choice::Yes == standing;
    if (StandingAnswers::Choice::Ask == standing) {
        std::string answer;
        std::string const title = prompt.GetTitle().Empty() ? std::string() : prompt.GetTitle().ToStd() + ": ";
        isYes = Ask(title + prompt.GetMessage().ToStd() + " " + Text("[y/N]", "Question"),
                    isMissing ? "--locate, --no-locate" : "--upgrade, --no-upgrade", answer) &&
                IsYes(answer);
    }
    auto const choices = static_cast<unsigned>(prompt.GetChoices());
    auto const pick = [choices](DocumentPromptChoice first, DocumentPromptChoice second) {
        return 0 != (choices & first) ? first : 0 != (choices & second) ? second : PromptNothing;
    };
    prompt.Answer(isYes ? pick(PromptYes, PromptOk) : pick(PromptNo, PromptCancel));
}

void Listener::AnswerFile(Book::ChooseChapterFileNotification const & prompt)
{
    std::string const question =
        Text("%1: where is %2 now? (nothing ends the search)", "Program", prompt.GetTitle(), prompt.GetCurrentPath());
    std::string answer;
    while (m_Ask && m_Ask(question, answer) && !answer.empty()) {
        std::error_code error;
        std::filesystem::path const file = std::filesystem::absolute(answer, error).lexically_normal();
        if (std::filesystem::is_regular_file(file, error)) {
            prompt.ProcessResponse(String(file.string()));
            return;
        }
        m_Console.Tell(
            {Import::Severity::Warning, "no-file", {file.string()}, Text("There is no such file.", "Program")});
    }
    {
        std::lock_guard const lock(m_Lock);
        m_HasGivenUp = true;
    }
    prompt.ProcessResponse(String());
}

void Listener::AnswerPasswords(RequestPdfPasswordsNotification const & request)
{
    RequestPdfPasswordsNotification::Passwords passwords;
    for (Kernel::Counted<Kernel::DataSource const> const & source : request.GetSources()) {
        std::string const path = source->GetPath().ToStd();
        std::string const password = m_Answers.m_Passwords ? m_Answers.m_Passwords->Find(path, false) : std::string();
        if (!password.empty()) {
            passwords.emplace(source, String(password));
            continue;
        }
        bool isNew = false;
        {
            std::lock_guard const lock(m_Lock);
            isNew = m_ToldLocked.insert(path).second;
        }
        if (isNew) {
            Add(Import::Severity::Warning, "picture-locked", path,
                Text("The placed PDF is protected by a password and shows as a marked box; --password FILE=... gives "
                     "it.",
                     "Program"));
        }
    }
    request.Answer(passwords);
}

void Listener::AnswerPermission(Book::PromptFixBookPermissionsNotification const & prompt)
{
    std::string const path = prompt.GetChapterPath().ToStd();
    std::string question = prompt.GetTitle().ToString().ToStd() + ": " + prompt.GetMessage().ToString().ToStd();
    if (std::size_t const place = question.find("%@"); std::string::npos != place) {
        question.replace(place, 2, path);
    }
    std::string answer;
    if (!m_Ask || !m_Ask(question + " " + Text("[r]etry, [i]gnore this file, ignore [a]ll:", "Program"), answer)) {
        Add(Import::Severity::Error, "chapter-denied", path,
            Text("The chapter's file may not be read; give yourself the right to read it (chmod u+r) or ask its owner, "
                 "and "
                 "try again.",
                 "Program"));
        prompt.IgnoreAll();
    } else if (answer.starts_with('i')) {
        prompt.Ignore();
    } else if (answer.starts_with('a')) {
        prompt.IgnoreAll();
    } else {
        prompt.Retry(false);
    }
}

}
