// What a colleague, a disk or another program does to a chapter's file, and what becomes of the book.

#include "commands/AddChapterCommand.h"
#include "commands/UpdateChapterCommand.h"
#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "framework/commands/ModifySectionCommand.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/document/EmbeddedDocumentNode.h"
#include "framework/document/RequestPdfPasswordsNotification.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/DiskFault.h"
#include "framework/kernel/FileLock.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Semaphore.h"
#include "framework/kernel/Trace.h"
#include "support/BookBuilder.h"
#include "support/DocumentBuilder.h"
#include "support/NotificationRecorder.h"
#include "support/OrdinaryUser.h"

#include <cstdlib>
#include <filesystem>
#include <gtest/gtest.h>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

namespace fs = std::filesystem;

class ChapterFilesTest : public testing::Test
{
protected:
    ChapterFilesTest() { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false); }
    ~ChapterFilesTest() override { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true); }

    Counted<BookController> MakeBook(std::vector<String> const & paths)
    {
        auto const book = m_Builder.NewBook(paths);
        BookBuilder::Rest();
        return book;
    }
    /// Makes the document dirty, as renumbering does.
    static void StartAt(Counted<DocumentController> const & document, unsigned int page)
    {
        auto const command = MakeCounted<ModifySectionCommand>(0u);
        command->SetStartNumberingAt(page);
        m_Application.EnqueueCommandAndWait(command, document, false);
        ASSERT_TRUE(document->IsDirty());
    }
    static unsigned int StartOf(String const & path)
    {
        auto const document = LoadTestDocument(path, nullptr);
        return document ? document->GetDocument()->GetSection(0)->GetStartNumberingAt() : 0;
    }

    static inline VantraController & m_Application = VantraController::GetInstance();
    BookBuilder m_Builder;
};

}

TEST_F(ChapterFilesTest, APassFindsWhatAColleagueHasDone)
{
    using Status = BookChapter::Status;
    struct Row
    {
        char const * m_Why;
        std::function<void(fs::path const &)> m_Deed;
        Status m_Status;
        char const * m_Pages;
        int m_PageCount;
    };
    std::vector<Row> const rows{
        {"renamed", [](fs::path const & file) { fs::rename(file, file.string() + ".bak"); }, Status::NotFound, "", 2},
        {"deleted", [](fs::path const & file) { fs::remove(file); }, Status::NotFound, "", 2},
        {"replaced by a longer one",
         [this](fs::path const & file) {
             ChapterSketch longer;
             longer.m_Pages = 5;
             m_Builder.WriteChapter(file.filename().string(), longer);
         },
         Status::OutOfDate, "1 - 5", 5},
        {"given another time",
         [](fs::path const & file) { fs::last_write_time(file, fs::last_write_time(file) - std::chrono::hours(2)); },
         Status::OutOfDate, "1 - 2", 2},
        {"cut off in the middle of a copy", [](fs::path const & file) { fs::resize_file(file, fs::file_size(file) / 2); },
         Status::NotFound, "", 2},
        {"emptied", [](fs::path const & file) { fs::resize_file(file, 0); }, Status::NotFound, "", 2},
        {"a folder in its place",
         [](fs::path const & file) {
             fs::remove(file);
             fs::create_directory(file);
         },
         Status::NotFound, "", 2}};
    for (Row const & row : rows) {
        ChapterSketch two;
        two.m_Pages = 2;
        String const path = m_Builder.WriteChapter("a.kvdoc", two);
        auto const book = MakeBook({path, m_Builder.WriteChapter("b.kvdoc")});
        auto const chapter = book->GetChapterAtIndex(0);
        NotificationRecorder recorder;
        row.m_Deed(path.ToStd());
        book->UpdateChapters();
        BookBuilder::Rest();
        EXPECT_EQ(chapter->GetStatus(), row.m_Status) << row.m_Why;
        EXPECT_EQ(chapter->DescribePages(), row.m_Pages) << row.m_Why;
        EXPECT_EQ(chapter->GetPageCount(), row.m_PageCount) << row.m_Why << ": what was known stays known";
        EXPECT_FALSE(recorder.All<ChapterChangedNotification const>().empty()) << row.m_Why;
        EXPECT_EQ(book->GetChapterAtIndex(1)->GetStatus(), Status::Ok) << row.m_Why << ": the others go on";
        EXPECT_TRUE(m_Application.GetDocumentControllers().empty()) << row.m_Why;
        EXPECT_EQ(m_Application.GetLoadingItems(), 0) << row.m_Why;
        m_Builder.CloseBook(book);
        BookBuilder::Rest();
        std::error_code ignored;
        fs::remove_all(path.ToStd(), ignored);
    }
}

TEST_F(ChapterFilesTest, AFileThatIsShutIsLockedAndOneThatMayNotBeWrittenLosesNothing)
{
    if (RanAsOrdinaryUser()) {
        return;
    }
    ChapterSketch two;
    two.m_Pages = 2;
    String const path = m_Builder.WriteChapter("a.kvdoc", two);
    auto const book = MakeBook({path});
    auto const chapter = book->GetChapterAtIndex(0);
    fs::permissions(path.ToStd(), fs::perms::none);
    book->UpdateChapters();
    BookBuilder::Rest();
    EXPECT_EQ(chapter->GetStatus(), BookChapter::Status::Locked) << "it is there, and something keeps it from us";
    EXPECT_EQ(chapter->GetPageCount(), 2);
    fs::permissions(path.ToStd(), fs::perms::owner_read);
    book->UpdateChapters();
    BookBuilder::Rest();
    EXPECT_EQ(chapter->GetStatus(), BookChapter::Status::Ok);

    // It may be read and not written: a change is not lost.
    auto const document = book->LoadChapterDocument(chapter, false, false);
    ASSERT_TRUE(document);
    StartAt(document, 12);
    fs::permissions(m_Builder.GetFolder().GetPath().ToStd(), fs::perms::owner_read | fs::perms::owner_exec);
    NotificationRecorder recorder;
    book->ReleaseChapterDocument(chapter, true);
    auto const failures = recorder.All<DocumentSaveFailedNotification const>();
    fs::permissions(m_Builder.GetFolder().GetPath().ToStd(), fs::perms::owner_all);
    ASSERT_EQ(failures.size(), 1u);
    EXPECT_EQ(StartOf(failures[0]->GetKeptPath()), 12u) << failures[0]->GetKeptPath();
    EXPECT_EQ(StartOf(path), 1u);
    Kernel::FileSystem::Delete(failures[0]->GetKeptPath(), 0);
}

TEST_F(ChapterFilesTest, AReleaseThatCannotSaveKeepsTheChangesAndSaysWhere)
{
    TemporaryFolder const elsewhere;
    String const chapterFolder = m_Builder.GetFolder().GetPath();
    struct Row
    {
        char const * m_Why;
        /// What the disk refuses, by file.
        std::function<bool(std::string_view)> m_Refuses;
        /// Folder in which the changes are found; empty: nowhere.
        String m_KeptIn;
    };
    int writes = 0;
    std::vector<Row> const rows{
        {"room for the copy only", [&writes](std::string_view) { return ++writes == 1; }, chapterFolder},
        {"the chapter's disk is full",
         [&](std::string_view file) { return file.starts_with(chapterFolder.View()); }, elsewhere.GetPath()},
        {"all disks are full", [](std::string_view) { return true; }, String()}};
    char const * const oldTemporary = std::getenv("TMPDIR");
    std::string const restored = oldTemporary ? oldTemporary : "/tmp";
    setenv("TMPDIR", elsewhere.GetPath().c_str(), 1);
    for (Row const & row : rows) {
        String const path = m_Builder.WriteChapter("a.kvdoc");
        auto const book = MakeBook({path});
        auto const chapter = book->GetChapterAtIndex(0);
        auto const document = book->LoadChapterDocument(chapter, false, false);
        ASSERT_TRUE(document);
        StartAt(document, 31);
        std::string const before = m_Builder.GetFolder().ReadFile("a.kvdoc");
        NotificationRecorder recorder;
        Kernel::DiskFault::SetHandler([&row](Kernel::DiskOperation operation, String const & file) {
            return operation == Kernel::DiskOperation::Write && row.m_Refuses(file.View()) ? ENOSPC : 0;
        });
        EXPECT_TRUE(book->ReleaseChapterDocument(chapter, true));
        BookBuilder::Rest();
        Kernel::DiskFault::SetHandler({});

        EXPECT_EQ(m_Builder.GetFolder().ReadFile("a.kvdoc"), before) << row.m_Why << ": the file is as it was";
        EXPECT_TRUE(m_Application.GetDocumentControllers().empty()) << row.m_Why;
        auto const failures = recorder.All<DocumentSaveFailedNotification const>();
        ASSERT_EQ(failures.size(), 1u) << row.m_Why;
        EXPECT_EQ(failures[0]->GetPath(), path) << row.m_Why;
        EXPECT_FALSE(failures[0]->GetReason().Empty()) << row.m_Why;
        String const kept = failures[0]->GetKeptPath();
        EXPECT_EQ(fs::path(kept.ToStd()).parent_path().string(), row.m_KeptIn.ToStd()) << row.m_Why;
        if (!kept.Empty()) {
            EXPECT_EQ(kept.View().substr(row.m_KeptIn.Length()), "/a.kvdoc.unsaved-1") << row.m_Why;
            EXPECT_EQ(StartOf(kept), 31u) << row.m_Why;
            Kernel::FileSystem::Delete(kept, 0);
        }
        m_Builder.CloseBook(book);
        BookBuilder::Rest();
    }
    setenv("TMPDIR", restored.c_str(), 1);
}

TEST_F(ChapterFilesTest, ADocumentThatAnotherBookHasClosedIsGivenOutNoMore)
{
    String const path = m_Builder.WriteChapter("shared.kvdoc");
    auto const first = MakeBook({path});
    auto const second = MakeBook({path});
    Counted<BookChapter const> const one = first->GetChapterAtIndex(0);
    Counted<BookChapter const> const two = second->GetChapterAtIndex(0);
    auto const document = first->LoadChapterDocument(one, false, false);
    ASSERT_TRUE(document);
    EXPECT_EQ(second->LoadChapterDocument(two, false, false), document);
    EXPECT_EQ(two->GetStatus(), BookChapter::Status::OpenForEdit);
    EXPECT_TRUE(first->ReleaseChapterDocument(one, false));
    EXPECT_TRUE(second->ReleaseChapterDocument(two, false));
    BookBuilder::Rest();
    EXPECT_EQ(first->GetDocumentControllerForChapter(one, false), nullptr);
    EXPECT_FALSE(first->ReleaseChapterDocument(one, false)) << "nothing is left to release";
    auto const again = first->LoadChapterDocument(one, false, false);
    ASSERT_TRUE(again);
    EXPECT_TRUE(again->IsAbleToRunCommands());
    EXPECT_EQ(second->LoadChapterDocument(two, false, false), again);
    first->ReleaseChapterDocument(one, false);
    EXPECT_TRUE(again->IsAbleToRunCommands()) << "the other book has it still";
    second->ReleaseChapterDocument(two, false);
    BookBuilder::Rest();
    EXPECT_TRUE(m_Application.GetDocumentControllers().empty());
}

TEST_F(ChapterFilesTest, TheUsersCloseIsFollowedByAPassOnlyIfTheFileHasChanged)
{
    struct Row
    {
        char const * m_Why;
        bool m_ChangesFile;
        std::size_t m_Passes;
    };
    for (Row const & row : {Row{"closed as it was opened", false, 0u}, Row{"touched meanwhile", true, 1u}}) {
        String const path = m_Builder.WriteChapter("a.kvdoc");
        auto const book = MakeBook({path, m_Builder.WriteChapter("b.kvdoc")});
        OpenDocumentFailedNotification failure(path, true);
        auto const document = m_Application.OpenDocument(path, failure);
        ASSERT_TRUE(document);
        BookBuilder::Rest();
        EXPECT_EQ(book->GetChapterAtIndex(0)->GetStatus(), BookChapter::Status::OpenForEdit);
        if (row.m_ChangesFile) {
            fs::last_write_time(path.ToStd(), fs::last_write_time(path.ToStd()) + std::chrono::seconds(3));
        }
        NotificationRecorder recorder;
        m_Application.EnqueueCommandAndWait(MakeCounted<CloseDocumentCommand>(document, nullptr, false, false));
        std::size_t passes = 0;
        for (auto const & change : recorder.All<ChapterChangedNotification const>()) {
            passes += change->GetChapters().size() == 2 ? 1 : 0;
        }
        EXPECT_EQ(passes, row.m_Passes) << row.m_Why;
        EXPECT_EQ(book->GetChapterAtIndex(0)->GetStatus(), BookChapter::Status::Ok) << row.m_Why;
        EXPECT_FALSE(book->GetChapterAtIndex(0)->WouldUpdateTimeStamp()) << row.m_Why;
        m_Builder.CloseBook(book);
        BookBuilder::Rest();
    }
}

namespace
{

/// Books whose chapter "locked.kvdoc" cannot be opened without asking the user for a password.
class PasswordTest : public ChapterFilesTest
{
protected:
    using Request = RequestPdfPasswordsNotification const;

    PasswordTest()
    {
        String const path = m_Builder.WriteChapter("locked.kvdoc");
        auto const document = LoadTestDocument(path, nullptr);
        document->GetDocument()->GetSpreadAtIndex(0)->AppendChild(
            NodeChildListItems, MakeCounted<EmbeddedDocumentNode>(Kernel::RectT<double>{0, 0, 50, 50},
                                                                  m_Builder.GetFolder() / "figure.pdf", "figure", true));
        document->MarkChanged();
        SaveTestDocument(*document, path);
        document->ShutDownArchive();
        m_Path = path;
    }
    /// A book of that chapter and one of its own; the first question that this raises is answered with nothing.
    Counted<BookController> MakeLockedBook(std::string const & other)
    {
        auto const book = m_Builder.NewBook();
        BookCollection::GetInstance().EnqueueCommand(
            MakeCounted<AddChapterCommand>(std::vector<String>{m_Builder.WriteChapter(other), m_Path}, nullptr), book);
        Asked()->Answer({});
        BookBuilder::Rest();
        m_Recorder.Clear();
        return book;
    }
    /// The question that is up.
    Counted<Request> Asked()
    {
        auto const questions = m_Recorder.All<Request>();
        EXPECT_EQ(questions.size(), 1u);
        return questions.back();
    }
    static void StartUpdate(Counted<BookController> const & book, int chapter, Kernel::Semaphore * done)
    {
        auto const command =
            MakeCounted<UpdateChapterCommand>(Counted<BookChapter const>(book->GetChapterAtIndex(chapter)));
        if (done) {
            command->SetCompletionCallback([done] { done->Signal(); });
        }
        BookCollection::GetInstance().EnqueueCommand(command, book);
    }
    static RequestPdfPasswordsNotification::Passwords Passwords(Request const & question, char const * word)
    {
        RequestPdfPasswordsNotification::Passwords passwords;
        for (auto const & source : question.GetSources()) {
            passwords[source] = word;
        }
        return passwords;
    }

    NotificationRecorder m_Recorder;
    String m_Path;
};

}

TEST_F(PasswordTest, ALoadThatWaitsForTheUserStopsOnlyThoseWhoNeedThatFile)
{
    auto const asking = MakeLockedBook("a.kvdoc");
    auto const sharing = MakeLockedBook("b.kvdoc");
    auto const other = MakeBook({m_Builder.WriteChapter("c.kvdoc")});
    m_Recorder.Clear();
    Kernel::Semaphore asked(0);
    StartUpdate(asking, 1, &asked);
    auto const question = Asked();
    ASSERT_TRUE(question);

    // Another book goes on; who only wants the asking book's lock gets it.
    BookBuilder::Run(other, MakeCounted<UpdateChapterCommand>(Counted<BookChapter const>(other->GetChapterAtIndex(0))));
    asking->AcquireWriterLock();
    asking->ReleaseWriterLock();

    // One that needs the same file waits for it, without holding its own lock.
    Kernel::Semaphore began(0);
    Kernel::SetTraceTarget([&](String const & line) {
        if (line.View().starts_with("LoadChapter:")) {
            began.Signal();
        }
    });
    Kernel::Semaphore shared(0);
    StartUpdate(sharing, 1, &shared);
    began.Wait(0);
    sharing->AcquireWriterLock();
    sharing->ReleaseWriterLock();
    Kernel::SetTraceTarget({});

    EXPECT_TRUE(question->Answer(Passwords(*question, "open sesame")));
    EXPECT_FALSE(question->Answer({})) << "the first answer counts";
    asked.Wait(0);
    shared.Wait(0);
    BookBuilder::Rest();
    EXPECT_EQ(asking->GetChapterAtIndex(1)->GetPassword("figure"), "open sesame");
    EXPECT_TRUE(m_Application.GetDocumentControllers().empty());
}

TEST_F(PasswordTest, EachLoadAsksAnewAndARefusalIsNoFailure)
{
    auto const book = MakeLockedBook("a.kvdoc");
    for (int round = 0; round < 2; ++round) {
        m_Recorder.Clear();
        Kernel::Semaphore done(0);
        StartUpdate(book, 1, &done);
        Asked()->Answer({});
        done.Wait(0);
        EXPECT_EQ(book->GetChapterAtIndex(1)->GetStatus(), BookChapter::Status::Ok);
        EXPECT_EQ(book->GetChapterAtIndex(1)->GetPageCount(), 1);
        EXPECT_EQ(book->GetChapterAtIndex(1)->GetPassword("figure"), "");
    }
    BookBuilder::Rest();
}

TEST_F(PasswordTest, ABookThatClosesWithAQuestionUpDoesNotWaitForTheUser)
{
    auto const book = MakeLockedBook("a.kvdoc");
    Kernel::Semaphore done(0);
    StartUpdate(book, 1, &done);
    auto const question = Asked();
    ASSERT_TRUE(question);
    m_Builder.CloseBook(book);
    done.Wait(0);
    BookBuilder::Rest();
    EXPECT_FALSE(question->Answer(Passwords(*question, "too late")));
    EXPECT_TRUE(m_Application.GetDocumentControllers().empty());
    Kernel::FileLock::Result result{};
    EXPECT_TRUE(Kernel::FileLock::Acquire(m_Path, Kernel::FileLock::Kind::Exclusive, result)) << "nobody holds the file";
}
