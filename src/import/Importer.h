#pragma once

#include "import/BookPlan.h"
#include "import/PictureLoader.h"
#include "import/Template.h"
#include "import/WorkState.h"

#include <atomic>
#include <functional>
#include <mutex>

namespace Import
{

struct ChapterText;

/// A chapter document that the work folder holds for the book, in reading order.
struct ImportedChapter
{
    /// Name in the plan; empty for the title page.
    std::string m_Name;
    /// What people call the chapter: its name in outlines and lists.
    std::string m_Title;
    std::filesystem::path m_Document;
    /// Made or changed by this run.
    bool m_IsFresh = false;
};

/// Brings the chapter documents of a work folder in step with a book's sources. A document whose source, pictures,
/// template and other facts are what they were is not touched. One that is made anew keeps its identity, the uids of
/// its anchors and its start numbers.
class Importer
{
public:
    /// Called on any of the importer's threads, one call at a time: how many chapters of how many are looked at.
    using Progress = std::function<void(int done, int all)>;

    /// `abort` is polled between chapters and may be null. All are borrowed.
    Importer(BookPlan const & plan, Template const & look, std::filesystem::path work, std::atomic<bool> const * abort);

    /// Who knows the passwords of protected PDFs that chapters place; without one they show as marked boxes.
    void SetPasswords(PasswordSource passwords) { m_Passwords = std::move(passwords); }

    /// Imports what has changed, two chapters at a time. Chapters that can't be read are errors in `messages` and left
    /// out. False if the work folder can't be used or the user has aborted; then documents that were finished stay, and
    /// none is half-written.
    bool Run(std::vector<ImportedChapter> & chapters, MessageList & messages, Progress const & progress);

    /// Whether nothing at all has changed since a build ended: no source, no fact, and no document by another hand. If
    /// so, the messages of the unchanged chapters are appended. Writes nothing.
    bool IsEverythingCurrent(MessageList & messages);

    /// The memory of the folder, for the one who builds: it is saved by `Run` and again when the build has ended.
    [[nodiscard]] WorkState & State() { return m_State; }

private:
    /// One chapter's way through the import; jobs share nothing that they change.
    struct Job
    {
        PlannedChapter const * m_Planned = nullptr;
        KnownChapter m_Known;
        MessageList m_Messages;
        bool m_IsFresh = false;
        bool m_IsUsable = false;
    };

    [[nodiscard]] std::vector<Job> MakeJobs() const;
    void RunJob(Job & job) const;
    bool IsCurrent(Job & job, std::uint64_t facts) const;
    /// The document is there and, if another hand than the importer's has been at it, still a document.
    [[nodiscard]] bool IsUsable(KnownChapter const & known) const;
    void Import(Job & job, std::uint64_t facts) const;
    bool WriteDocument(Job & job, ChapterText const & chapter) const;
    [[nodiscard]] std::uint64_t FactsOfTitlePage() const;
    bool WriteTitleDocument(std::vector<ImportedChapter> & chapters, MessageList & messages);
    void CheckLinks(std::vector<Job> & jobs, MessageList & messages) const;
    void NameDocuments(std::vector<Job> & jobs) const;
    [[nodiscard]] std::uint64_t FactsOf(PlannedChapter const & chapter) const;
    [[nodiscard]] std::uint64_t FactsOfLinks(PlannedChapter const & chapter,
                                             std::vector<KnownLink> const & links) const;
    [[nodiscard]] bool IsAborted() const { return m_Abort && *m_Abort; }

    BookPlan const & m_Plan;
    Template const & m_Look;
    std::filesystem::path m_Work;
    std::atomic<bool> const * m_Abort = nullptr;
    PasswordSource m_Passwords;
    WorkState m_State;
    std::vector<std::string> m_Names;
};

}
