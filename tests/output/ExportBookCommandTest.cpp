#include "output/ExportBookCommand.h"

#include "core/BookCollection.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/DiskFault.h"
#include "framework/kernel/FileSystem.h"
#include "framework/render/FileExportOptions.h"
#include "output/ExportBookCompleteNotification.h"
#include "support/BookBuilder.h"
#include "support/NotificationRecorder.h"
#include "support/PdfProbe.h"

#include <gtest/gtest.h>

#include <atomic>
#include <cerrno>
#include <cstdio>

namespace Book
{
namespace
{

class ExportBookCommandTest : public testing::Test
{
protected:
    Kernel::Counted<ExportBookCommand> Command(Kernel::Counted<BookController> const & book, String const & target, bool temp)
    {
        std::vector<Kernel::Counted<BookChapter const>> chapters;
        book->GetChapters(chapters);
        auto const options = Kernel::MakeCounted<Renderer::FileExportOptionsPDF>();
        Renderer::FileExportOptionsPDF::Settings settings;
        settings.m_FixedTime = 1;
        options->SetSettings(settings);
        return Kernel::MakeCounted<ExportBookCommand>(
            chapters, target, Kernel::Consolidated<Renderer::FileExportOptions>(Kernel::Counted<Renderer::FileExportOptionsPDF const>(options)),
            Kernel::Size{}, temp, false, false, true, nullptr);
    }

    /// Exports and gives the results of the one notification that tells of it.
    std::vector<ExportBookCompleteNotification::Rec> Export(Kernel::Counted<BookController> const & book, String const & target)
    {
        NotificationRecorder recorder;
        BookBuilder::Run(book, Command(book, target, false));
        auto const told = recorder.All<ExportBookCompleteNotification>();
        EXPECT_EQ(told.size(), 1u);
        return told.empty() ? std::vector<ExportBookCompleteNotification::Rec>() : told.front()->GetRecs();
    }

    Kernel::Counted<BookController> TwoChapters()
    {
        auto const book = m_Builder.NewBook({m_Builder.WriteChapter("First things.kvdoc", {.m_Pages = 3, .m_Title = "The whole"}),
                                             m_Builder.WriteChapter("Last things.kvdoc", {.m_Pages = 2})});
        BookCollection::GetInstance().PreOutput(book, {book->GetChapterAtIndex(0), book->GetChapterAtIndex(1)});
        BookBuilder::Rest();
        return book;
    }

    BookBuilder m_Builder;
};

TEST_F(ExportBookCommandTest, AllChaptersComeOutAsOneFile)
{
    auto const book = TwoChapters();
    String const target = m_Builder.GetFolder() / "book.pdf";
    auto const records = Export(book, target);
    ASSERT_EQ(records.size(), 1u);
    EXPECT_EQ(records[0].m_Result, ExportResultOk);
    EXPECT_EQ(records[0].m_Path, target);
    EXPECT_TRUE(book->IsDirty());

    PdfProbe const pdf(target);
    EXPECT_EQ(pdf.Check(), "");
    EXPECT_EQ(pdf.PageCount(), 5);
    EXPECT_EQ(pdf.Labels(), (std::vector<std::string>{"1", "2", "3", "4", "5"}));
    EXPECT_NE(pdf.Text(4).find("Page 1"), std::string::npos) << "the second chapter's own first page";
    EXPECT_NE(pdf.Outline().find("First things -> page 1"), std::string::npos) << pdf.Outline();
    EXPECT_NE(pdf.Outline().find("Last things -> page 4"), std::string::npos) << pdf.Outline();
    std::string const metadata = pdf.Stream("Metadata");
    EXPECT_NE(metadata.find("The whole"), std::string::npos) << "the key chapter's metadata";
    EXPECT_NE(metadata.find("1970-01-01T00:00:01Z"), std::string::npos) << "at the time that the options fix";
    EXPECT_EQ(metadata.find("Date=\"2"), std::string::npos) << metadata;
}

TEST_F(ExportBookCommandTest, AChapterThatIsGoneIsLeftOutOfTheFile)
{
    auto const book = TwoChapters();
    std::remove(book->GetChapterAtIndex(1)->GetPath().c_str());
    String const target = m_Builder.GetFolder() / "book.pdf";
    auto const records = Export(book, target);
    ASSERT_EQ(records.size(), 1u);
    EXPECT_EQ(records[0].m_Result, ExportResultOk);
    EXPECT_EQ(PdfProbe(target).PageCount(), 3);
}

TEST_F(ExportBookCommandTest, ATargetThatCannotBeMadeIsNamed)
{
    auto const book = TwoChapters();
    String const target = m_Builder.GetFolder() / "no such folder/book.pdf";
    NotificationRecorder recorder;
    BookBuilder::Run(book, Command(book, target, false));
    auto const told = recorder.All<ExportBookCompleteNotification>();
    ASSERT_EQ(told.size(), 1u);
    EXPECT_EQ(told[0]->GetRecs()[0].m_Result, ExportResultFileNotCreated);
    String message;
    String title;
    ASSERT_TRUE(told[0]->GetErrorStrings(message, title));
    EXPECT_EQ(title, "Errors occurred while exporting");
    EXPECT_EQ(message, String("The file could not be created:\n") + target + "\n");
}

TEST_F(ExportBookCommandTest, AThrowAwayExportTellsOfSuccessOnlyAndEveryExportLeavesTheBookDirty)
{
    auto const book = TwoChapters();
    struct Row
    {
        char const * name;
        bool temp;
        std::size_t told;
    };
    for (Row const & row : {Row{"none/book.pdf", true, 0}, Row{"none/book.pdf", false, 1}, Row{"book.pdf", true, 1}}) {
        SCOPED_TRACE(row.name);
        book->SetIsDirty(false);
        NotificationRecorder recorder;
        BookBuilder::Run(book, Command(book, m_Builder.GetFolder() / row.name, row.temp));
        auto const told = recorder.All<ExportBookCompleteNotification>();
        ASSERT_EQ(told.size(), row.told);
        EXPECT_TRUE(book->IsDirty());
        for (auto const & notification : told) {
            EXPECT_EQ(notification->IsTemp(), row.temp);
            EXPECT_EQ(notification->GetOriginalFilename(), m_Builder.GetFolder() / row.name);
        }
    }
}

TEST_F(ExportBookCommandTest, AnAbortLeavesTheTargetAlone)
{
    auto const book = TwoChapters();
    String const target = m_Builder.GetFolder().WriteFile("book.pdf", "the one before");
    auto const command = Command(book, target, false);
    command->Abort();
    NotificationRecorder recorder;
    BookBuilder::Run(book, command);
    EXPECT_TRUE(recorder.All<ExportBookCompleteNotification>().empty()) << "it stopped before the writer";
    EXPECT_EQ(m_Builder.GetFolder().ReadFile("book.pdf"), "the one before");
}

TEST_F(ExportBookCommandTest, OpenChaptersHoldStillForItAndAreLetGoHoweverItEnds)
{
    auto const book = TwoChapters();
    VantraController & application = VantraController::GetInstance();
    String const path = book->GetChapterAtIndex(1)->GetPath();
    OpenDocumentFailedNotification failure(path, true);
    auto const document = application.OpenDocument(path, failure);
    ASSERT_TRUE(document) << failure.GetReason();
    BookBuilder::Rest();
    enum class End
    {
        Done,
        Failed,
        AbandonedAtItsFirstCheck
    };
    for (End const end : {End::Done, End::Failed, End::AbandonedAtItsFirstCheck}) {
        std::atomic<int> held{0};
        std::atomic<int> free{0};
        auto const command = Command(book, m_Builder.GetFolder() / "book.pdf", false);
        if (end == End::AbandonedAtItsFirstCheck) {
            command->Abort();
        }
        Kernel::DiskFault::SetHandler([&](Kernel::DiskOperation operation, String const &) {
            if (operation != Kernel::DiskOperation::Write) {
                return 0;
            }
            ++(document->IsBookLockEngaged() ? held : free);
            return end == End::Failed ? ENOSPC : 0;
        });
        BookBuilder::Run(book, command);
        Kernel::DiskFault::SetHandler({});
        EXPECT_EQ(held != 0, end != End::AbandonedAtItsFirstCheck) << static_cast<int>(end);
        EXPECT_EQ(free, 0) << static_cast<int>(end) << ": nothing is written of a document that may change";
        EXPECT_FALSE(document->IsBookLockEngaged()) << static_cast<int>(end);
    }
    Kernel::Counted<DocumentController const> const closing = document;
    application.EnqueueCommandAndWait(Kernel::MakeCounted<CloseDocumentCommand>(closing, nullptr, false, false));
}

/// Files of the folder, and the temporary files that were made, are told apart by a part of their path; "" stands for data
/// that have no file of a name.
struct FaultRow
{
    char const * why;
    Kernel::DiskOperation operation;
    char const * where;
    int error;
    ExportResult result;
    char const * cause;
};

TEST_F(ExportBookCommandTest, AFailingDiskIsNamedAndLeavesTheTargetAlone)
{
    using Operation = Kernel::DiskOperation;
    auto const book = TwoChapters();
    String const target = m_Builder.GetFolder().WriteFile("book.pdf", "the one before");
    for (FaultRow const & row : {
             FaultRow{"no temporary file", Operation::Open, "/korvane-", EACCES, ExportResultFailed, "No temporary file"},
             FaultRow{"no place for the pages", Operation::Open, "*temporary", ENOSPC, ExportResultFileNotCreated, "No space"},
             FaultRow{"pages that find no room", Operation::Write, "", ENOSPC, ExportResultFailed, "Temporary data can't be written"},
             FaultRow{"a temporary file that finds none: a silent stop", Operation::Write, "/korvane-", ENOSPC,
                      ExportResultAborted, "No space left"},
             FaultRow{"or is too long", Operation::Write, "/korvane-", EFBIG, ExportResultAborted, "File too large"},
             FaultRow{"cannot be read back", Operation::Read, "/korvane-", EIO, ExportResultWriteFailed, "Cannot read"},
             FaultRow{"a folder that may not be written", Operation::Open, "/.book.pdf-", EACCES, ExportResultPermissionDenied,
                      "You have no permission"},
             FaultRow{"denied by the system", Operation::Open, "/.book.pdf-", EPERM, ExportResultAccessDenied, "denied by the system"},
             FaultRow{"a disk to read only", Operation::Open, "/.book.pdf-", EROFS, ExportResultPermissionDenied, "cannot be written to"},
             FaultRow{"a full disk", Operation::Open, "/.book.pdf-", ENOSPC, ExportResultOutOfSpace, "is full"},
             FaultRow{"a quota", Operation::Open, "/.book.pdf-", EDQUOT, ExportResultOutOfSpace, "quota"},
             FaultRow{"a name too long", Operation::Open, "/.book.pdf-", ENAMETOOLONG, ExportResultFileNotCreated, "too long"},
             FaultRow{"full half-way", Operation::Write, "/.book.pdf-", ENOSPC, ExportResultOutOfSpace, "No space left"},
             FaultRow{"a broken disk", Operation::Write, "/.book.pdf-", EIO, ExportResultWriteFailed, "Cannot write to"},
             FaultRow{"that shows at the end", Operation::Flush, "/.book.pdf-", EIO, ExportResultWriteFailed, "Cannot write to"},
             FaultRow{"a target that may not be replaced", Operation::Rename, "/book.pdf", EACCES, ExportResultPermissionDenied,
                      "Permission denied"},
         }) {
        SCOPED_TRACE(row.why);
        BookBuilder::Rest();
        auto const command = Command(book, target, false);
        std::vector<String> temporary;
        NotificationRecorder recorder;
        Kernel::DiskFault::SetHandler([&](Kernel::DiskOperation operation, String const & path) {
            bool const isTemporary = path.View().find("/korvane-") != std::string_view::npos &&
                                     !path.View().starts_with(m_Builder.GetFolder().GetPath().View());
            if (operation == Operation::Open && isTemporary) {
                temporary.push_back(path);
            }
            std::string_view const where(row.where);
            bool const isMeant = where == "*temporary" ? path == Kernel::FileSystem::GetTemporaryFolder()
                                 : where.empty()       ? path.Empty()
                                 : where == "/korvane-" ? isTemporary
                                                        : path.View().find(where) != std::string_view::npos;
            return operation == row.operation && isMeant ? row.error : 0;
        });
        BookBuilder::Run(book, command);
        BookBuilder::Rest();
        Kernel::DiskFault::SetHandler({});

        auto const told = recorder.All<ExportBookCompleteNotification>();
        ASSERT_EQ(told.size(), 1u);
        EXPECT_EQ(told[0]->GetRecs()[0].m_Result, row.result);
        EXPECT_NE(command->GetError().View().find(row.cause), std::string_view::npos) << command->GetError();
        EXPECT_EQ(m_Builder.GetFolder().ReadFile("book.pdf"), "the one before");
        EXPECT_EQ(RunCommand("ls -A '" + m_Builder.GetFolder().GetPath().ToStd() + "' | grep kvtmp"), "");
        for (String const & path : temporary) {
            EXPECT_FALSE(Kernel::FileSystem::Exists(path)) << path;
        }
    }
    EXPECT_EQ(Export(book, target)[0].m_Result, ExportResultOk);
    EXPECT_EQ(PdfProbe(target).Check(), "");
}

TEST_F(ExportBookCommandTest, StoppedAnywhereItLeavesTheOldFileOrAWholeNewOne)
{
    auto const book = TwoChapters();
    int whole = 0;
    for (int patience = 1; whole < 2; ++patience) {
        SCOPED_TRACE(patience);
        String const target = m_Builder.GetFolder().WriteFile("book.pdf", "the one before");
        BookBuilder::Rest();
        auto const command = Command(book, target, false);
        std::atomic<int> seen = 0;
        NotificationRecorder recorder;
        Kernel::DiskFault::SetHandler([&](Kernel::DiskOperation, String const &) {
            if (++seen == patience) {
                command->Abort();
            }
            return 0;
        });
        BookBuilder::Run(book, command);
        BookBuilder::Rest();
        Kernel::DiskFault::SetHandler({});
        auto const told = recorder.All<ExportBookCompleteNotification>();
        if (told.empty() || !IsSuccess(told[0]->GetRecs()[0].m_Result)) {
            EXPECT_TRUE(told.empty() || told[0]->GetRecs()[0].m_Result == ExportResultAborted);
            EXPECT_EQ(m_Builder.GetFolder().ReadFile("book.pdf"), "the one before");
            EXPECT_EQ(command->GetError(), "") << "nothing has failed";
        } else {
            EXPECT_EQ(PdfProbe(target).PageCount(), 5);
            ++whole;
        }
        ASSERT_LT(patience, 500);
    }
}

TEST(ExportBookCompleteNotificationTest, TextsStandInTheOrderOfTheFilesWithABlankLineBetween)
{
    ExportBookCompleteNotification notification(nullptr, "book.pdf", false, nullptr, nullptr);
    auto const add = [&](bool isSave, char const * path, ExportResult result) {
        notification.AddResult(isSave, path, nullptr, result, nullptr, nullptr);
    };
    String message;
    String title = "as it was";
    add(false, "a", ExportResultOk);
    add(false, "b", ExportResultAborted);
    add(false, "c", ExportResultFailed);
    EXPECT_FALSE(notification.GetErrorStrings(message, title));
    EXPECT_EQ(title, "as it was");

    add(false, "d", ExportResultAccessDenied);
    add(false, "e", ExportResultOutOfSpace);
    EXPECT_TRUE(notification.GetErrorStrings(message, title));
    EXPECT_EQ(message, "Access was denied:\nd\n\nThe destination device is out of space:\ne\n");
    EXPECT_EQ(title, "Errors occurred while exporting");
}

}
}
