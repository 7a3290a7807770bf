#include "commands/BookCommand.h"
#include "commands/CloseBookCommand.h"
#include "commands/LoadBookCommand.h"
#include "commands/NewBookCommand.h"
#include "commands/UpdateChaptersCommand.h"
#include "documents/BookLockCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/kernel/CommandCoverage.h"
#include "framework/kernel/FileStore.h"
#include "output/ExportToPDFCommand.h"

#include <gtest/gtest.h>

#include <algorithm>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

Kernel::LocalisedString Text(char const * text, char const * context)
{
    return {text, std::string_view(text).size(), context, std::string_view(context).size()};
}

struct CommandRow
{
    std::uint32_t m_Uid;
    char const * m_Name;
    char const * m_Description;
    char const * m_Context;
    DomainCommand::ProgressType m_Progress = DomainCommand::NoProgress;
};

/// What files, translations and scripts know the commands of a book's queue by.
constexpr CommandRow BookCommands[] = {
    {0x42616443, "Book::AddChapterCommand", "Add chapter", "Book Command"},
    {0x42646543, "Book::DeleteChaptersCommand", "Delete chapter", "Book Commands"},
    {0x424D7643, "Book::MoveChaptersCommand", "Move chapter", "Book Commands"},
    {0x42727043, "Book::ReplaceChapterCommand", "Replace chapter", "Book Commands"},
    {0x536B4343, "Book::SetKeyChapterCommand", "Set style source chapter", "Book Commands"},
    {0x53534843, "Book::SetStrayHandlingCommand", "Set stray handling", "Book Commands"},
    {0x53795374, "Book::SetSynchroniseSettingsCommand", "Set stray handling", "Book Commands"},
    {0x42537846, "Book::SetExportFormatFileExportOptionsCommand", "Set Export Format Options", "Book Commands"},
    {0x55435343, "Book::UpdateChapterSettingsCommand", "Update Chapter Settings", "Book Commands"},
    {0x53426B43, "Book::SaveBookCommand", "Save Book", "Book Command", DomainCommand::ShowProgress},
    {0x53426143, "Book::SaveBookAsCommand", "Save Book As", "Book Command", DomainCommand::ShowProgress},
    {0x53426150, "Book::SaveBookAsPackageCommand", "Save Book As Package", "Book Command",
     DomainCommand::ShowProgress},
    {0x436F7043, "Book::ChapterOpenCommand", "Chapter Open", "Book Command"},
    {0x42557043, "Book::UpdateChapterCommand", "Update chapter", "Book Commands"},
    {0x50726643, "Book::PreflightChaptersCommand", "Preflight chapters", "Book Commands", DomainCommand::ShowProgress},
    {0x45424C43, "Book::EngageBookLockCommand", "Engage BookLock", "Book Command"},
    {0x55704E43, "Book::UpdateNumbersCommand", "Update numbers", "Book Command", DomainCommand::ShowProgress},
    {0x534D4943, "Book::SetMasterIndexCommand", "Update Index", "Book Command"},
    {0x52634143, "Book::ReconcileAnchorsCommand", "Reconcile Anchors", "Book Command"},
    {0x45784243, "Book::ExportBookCommand", "Export Book", "Book Commands", DomainCommand::ShowProgress},
    {0x50724243, "Book::PrintBookCommand", "Print Book", "Book Commands", DomainCommand::ShowProgress},
    {0x50725066, "Book::PrintProofCommand", "Print Book", "Book Commands", DomainCommand::ShowProgress},
};

}

TEST(CommandTableTest, EveryBookCommandIsKnownByItsNumberItsNameAndItsText)
{
    for (CommandRow const & row : BookCommands) {
        Kernel::ClassProperties const * const properties = Kernel::ClassProperties::Find(Kernel::ClassUID(row.m_Uid));
        ASSERT_TRUE(properties) << row.m_Name;
        EXPECT_EQ(properties->GetVersion(), 1) << row.m_Name;
        EXPECT_EQ(properties->GetBase(), &BookCommand::GetTypeClassProperties()) << row.m_Name;
        auto const object = properties->GetCreator()();
        auto const command = Kernel::CountedCast<BookCommand>(object);
        ASSERT_TRUE(command) << row.m_Name;
        EXPECT_EQ(&command->GetObjectClassProperties(), properties) << row.m_Name;
        EXPECT_EQ(command->GetDescription(), Text(row.m_Description, row.m_Context)) << row.m_Name;
        EXPECT_EQ(command->GetProgressType(), row.m_Progress) << row.m_Name;
        EXPECT_FALSE(command->ShouldStackForUndo()) << row.m_Name;
        EXPECT_EQ(command->GetDomainController(), nullptr) << row.m_Name << " has no book before it is dequeued";
        BookCommand const & typed = *command;
        EXPECT_STREQ(CommandCoverage::Instance().FindName(typeid(typed)), row.m_Name);
    }
}

TEST(CommandTableTest, NoBookCommandIsMissingInTheTable)
{
    for (std::string const & name : CommandCoverage::Instance().GetNames()) {
        if (!name.starts_with("Book::") || name == "Book::ExportToPDFCommand") {
            continue;
        }
        EXPECT_TRUE(std::any_of(std::begin(BookCommands), std::end(BookCommands), [&](CommandRow const & row) {
            return name == row.m_Name;
        })) << name << " has no row here";
    }
}

TEST(CommandTableTest, TheCommandsOfApplicationAndDocumentsStandApart)
{
    EXPECT_EQ(NewBookCommand().GetDescription(), Text("New book", "Command description"));
    EXPECT_EQ(LoadBookCommand("/x").GetDescription(), Text("Load book", "Command description"));
    EXPECT_EQ(CloseBookCommand(nullptr).GetDescription(), Text("Close book", "Book Commands"));
    EXPECT_EQ(UpdateChaptersCommand(true).GetDescription(), Text("Update chapters", "Book Commands"));
    EXPECT_EQ(BookLockCommand(true).GetDescription(), Kernel::LocalisedString());
    for (std::type_info const * const type : {&typeid(NewBookCommand), &typeid(LoadBookCommand),
                                              &typeid(CloseBookCommand), &typeid(BookLockCommand),
                                              &typeid(UpdateChaptersCommand)}) {
        EXPECT_EQ(CommandCoverage::Instance().FindName(*type), nullptr) << type->name();
    }

    struct Row
    {
        std::uint32_t m_Uid;
        Kernel::ClassProperties const * m_Properties;
    };
    for (Row const & row : {Row{0x424C6B43, &BookLockCommand::GetTypeClassProperties()},
                            Row{0x45504446, &ExportToPDFCommand::GetTypeClassProperties()}}) {
        EXPECT_EQ(Kernel::ClassProperties::Find(Kernel::ClassUID(row.m_Uid)), row.m_Properties);
        EXPECT_EQ(row.m_Properties->GetVersion(), 1);
        EXPECT_EQ(row.m_Properties->GetBase(), &DocumentCommand::GetTypeClassProperties());
    }
    auto const lock = Kernel::CountedCast<BookLockCommand>(BookLockCommand::GetTypeClassProperties().GetCreator()());
    ASSERT_TRUE(lock);
    EXPECT_FALSE(lock->ShouldStackForUndo());
    EXPECT_FALSE(lock->MakesDOMDirty());
    EXPECT_STREQ(CommandCoverage::Instance().FindName(typeid(ExportToPDFCommand)), "Book::ExportToPDFCommand");
}

TEST(CommandTableTest, ACommandOfABackgroundTaskHasNoClassInStreams)
{
    auto const command = MakeCounted<UpdateChaptersCommand>(true);
    EXPECT_EQ(command->GetObjectClassProperties().GetClassUID(), Kernel::ClassUID());
    EXPECT_EQ(Kernel::ClassProperties::Find(Kernel::ClassUID()), nullptr);
    EXPECT_FALSE(command->GetObjectClassProperties().IsKindOf(BookCommand::GetTypeClassProperties()));
}

TEST(CommandTableTest, ACommandLearnsItsBookFromTheQueueAndRefusesOtherDomains)
{
    auto const book = MakeCounted<BookController>();
    auto const document = MakeCounted<DocumentController>();
    auto const command = MakeCounted<UpdateChaptersCommand>(true);
    command->PostDequeueWithMutableDomainController(book.Get());
    EXPECT_EQ(command->GetBookController(), book);
    EXPECT_EQ(command->GetDomainController(), Counted<DomainController>(book));
    command->PostDequeueWithMutableDomainController(document.Get());
    EXPECT_EQ(command->GetBookController(), nullptr) << "a document is no book";
    command->PostLoad(book.Get());
    EXPECT_EQ(command->GetBookController(), book);
}
