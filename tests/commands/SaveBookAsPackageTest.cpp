#include "commands/SaveBookAsPackageCommand.h"

#include "commands/SaveBookCommand.h"
#include "core/BookCollection.h"
#include "framework/commands/ModifySectionCommand.h"
#include "framework/commands/PackageResourcesCommand.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentControllerSession.h"
#include "framework/document/DocumentPictures.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/document/PackageManagerInfo.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Archive.h"
#include "framework/kernel/DiskFault.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Path.h"
#include "framework/typeset/FontLibrary.h"
#include "support/BookBuilder.h"
#include "support/Child.h"
#include "support/DocumentBuilder.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <chrono>
#include <filesystem>
#include <cstdlib>
#include <future>
#include <thread>
#include <unistd.h>

using Book::BookChapter;
using Book::BookController;
using Book::SaveBookAsPackageCommand;
using Kernel::Counted;
using Kernel::FileSystem;
using Kernel::MakeCounted;

namespace
{

/// A picture of one pixel.
constexpr unsigned char Png[] = {
    0x89, 0x50, 0x4E, 0x47, 0x0D, 0x0A, 0x1A, 0x0A, 0x00, 0x00, 0x00, 0x0D, 0x49, 0x48, 0x44, 0x52, 0x00,
    0x00, 0x00, 0x01, 0x00, 0x00, 0x00, 0x01, 0x08, 0x00, 0x00, 0x00, 0x00, 0x3A, 0x7E, 0x9B, 0x55, 0x00,
    0x00, 0x00, 0x0A, 0x49, 0x44, 0x41, 0x54, 0x78, 0x9C, 0x63, 0x60, 0x00, 0x00, 0x00, 0x02, 0x00, 0x01,
    0x48, 0xAF, 0xA4, 0x71, 0x00, 0x00, 0x00, 0x00, 0x49, 0x45, 0x4E, 0x44, 0xAE, 0x42, 0x60, 0x82};

std::string ChapterPaths(BookController const & book)
{
    BookController::ConstChapterList chapters;
    book.GetChapters(chapters);
    std::string paths;
    for (auto const & chapter : chapters) {
        paths += chapter->GetPath().ToStd() + "\n";
    }
    return paths;
}

std::vector<String> NamesIn(String const & folder)
{
    std::vector<String> names;
    EXPECT_TRUE(FileSystem::ListFolder(folder, names)) << folder;
    return names;
}

class SaveBookAsPackageTest : public testing::Test
{
protected:
    void SetUp() override { ASSERT_TRUE(FileSystem::CreateFolders(m_Target.GetPath() + "/package")); }

    String Write(std::string const & name, ChapterSketch const & sketch)
    {
        std::string const file = name + ".kvdoc";
        FileSystem::CreateFolders(Kernel::Path::GetFolder(m_Books.GetFolder() / file));
        return m_Books.WriteChapter(file, sketch);
    }
    /// Packages all chapters.
    Counted<SaveBookAsPackageCommand> Package(Counted<BookController> const & book, String const & extension)
    {
        BookController::ConstChapterList chapters;
        book->GetChapters(chapters);
        auto const command =
            MakeCounted<SaveBookAsPackageCommand>(m_Target / "package/whole.kvbook", chapters, true, true, extension);
        BookBuilder::Run(book, command);
        return command;
    }
    /// The package elsewhere, as on another machine.
    String Move()
    {
        std::filesystem::rename((m_Target / "package").ToStd(), (m_Target / "moved").ToStd());
        return m_Target / "moved";
    }
    Counted<BookController> Load(String const & path)
    {
        auto const failure = MakeCounted<OpenDocumentFailedNotification>(path, false);
        auto const book = MakeCounted<BookController>();
        EXPECT_TRUE(book->LoadBook(path, *failure)) << failure->GetReason();
        book->DisableCommandEnqueueAndEmpty();
        return book;
    }

    BookBuilder m_Books;
    TemporaryFolder const m_Target;
};

}

TEST_F(SaveBookAsPackageTest, APackageOpensWhereItIsMovedTo)
{
    ChapterSketch sketch;
    sketch.m_Title = "First";
    String const first = Write("first", sketch);
    String const second = Write("second", {});
    auto const book = m_Books.NewBook({first, second});
    book->GetChapterAtIndex(1)->SetName("Renamed");
    book->GetChapterAtIndex(1)->SetStartFromPage(21);
    book->SetPadStrays(true);
    book->SetIsDirty(true);
    std::string const before = ChapterPaths(*book);
    Kernel::TimeStamp timeBefore;
    ASSERT_TRUE(FileSystem::GetModifiedTime(first, timeBefore));

    // The first pass over a new book notes what it finds in the chapters.
    BookBuilder::Rest();
    auto const command = Package(book, "kvdoc");
    ASSERT_TRUE(command->GetResult().IsSuccess()) << command->GetResult().GetText();
    EXPECT_TRUE(command->GetProblems().empty());
    EXPECT_EQ(ChapterPaths(*book), before) << "the open book has its chapters where they were";
    EXPECT_EQ(book->GetPath(), m_Target / "package/whole.kvbook");
    EXPECT_FALSE(book->IsDirty());
    Kernel::TimeStamp timeAfter;
    ASSERT_TRUE(FileSystem::GetModifiedTime(first, timeAfter));
    EXPECT_EQ(timeBefore, timeAfter) << "the chapters themselves are left alone";

    String const moved = Move();
    auto const loaded = Load(moved + "/whole.kvbook");
    EXPECT_EQ(ChapterPaths(*loaded), (moved + "/first.kvdoc\n" + moved + "/second.kvdoc\n").ToStd());
    EXPECT_TRUE(loaded->GetChapterAtIndex(0)->IsKey());
    EXPECT_EQ(BookBuilder::Names(*loaded), "first Renamed");
    EXPECT_EQ(loaded->GetChapterAtIndex(1)->GetStartFromPage(), 21);
    EXPECT_TRUE(loaded->IsPadStrays());
    Kernel::TimeStamp copied;
    ASSERT_TRUE(FileSystem::GetModifiedTime(moved + "/first.kvdoc", copied));
    EXPECT_EQ(loaded->GetChapterAtIndex(0)->GetTimeStamp(), copied) << "the copy counts as looked at";
    int result = 0;
    auto const document = LoadTestDocument(moved + "/first.kvdoc", &result);
    ASSERT_TRUE(document) << result;
    EXPECT_EQ(document->GetMetadata()->GetTitle(), "First");
}

TEST_F(SaveBookAsPackageTest, ChaptersOfOneNameBothSurvive)
{
    ChapterSketch sketch;
    sketch.m_Title = "One";
    String const one = Write("a/text", sketch);
    sketch.m_Title = "Two";
    String const two = Write("b/text", sketch);
    sketch.m_Title = "Three";
    String const three = Write("c/TEXT", sketch);
    auto const book = m_Books.NewBook({one, two, three});
    ASSERT_TRUE(Package(book, ".kvdoc")->GetResult().IsSuccess());
    String const folder = m_Target / "package";
    EXPECT_EQ(ChapterPaths(*Load(folder + "/whole.kvbook")),
              (folder + "/text.kvdoc\n" + folder + "/text-2.kvdoc\n" + folder + "/TEXT-3.kvdoc\n").ToStd());
    char const * const titles[] = {"One", "Two", "Three"};
    for (int i = 0; i < 3; ++i) {
        auto const document = LoadTestDocument(Load(folder + "/whole.kvbook")->GetChapterAtIndex(i)->GetPath(), nullptr);
        ASSERT_TRUE(document);
        EXPECT_EQ(document->GetMetadata()->GetTitle(), titles[i]);
    }
}

TEST_F(SaveBookAsPackageTest, ExtensionsAreChangedAsAskedFor)
{
    struct Row
    {
        char const * m_Extension;
        char const * m_Name;
    };
    String const chapter = Write("a", {});
    for (Row const & row : {Row{"ext2", "a.ext2"}, Row{".ext2", "a.ext2"}, Row{"", "a"}}) {
        auto const book = m_Books.NewBook({chapter});
        ASSERT_TRUE(Package(book, row.m_Extension)->GetResult().IsSuccess());
        EXPECT_TRUE(FileSystem::Exists(m_Target / "package/" + row.m_Name)) << row.m_Extension;
        FileSystem::Delete(m_Target / "package/" + row.m_Name, 0);
    }
}

TEST_F(SaveBookAsPackageTest, TheChaptersOwnFilesAreNeverOverwritten)
{
    // A book is packaged into the folder that holds one of its chapters, under the name that another one's copy wants.
    ChapterSketch sketch;
    sketch.m_Title = "Elsewhere";
    String const elsewhere = Write("text", sketch);
    sketch.m_Title = "Here";
    String const written = Write("here/text", sketch);
    String const here = m_Target / "package/text.kvdoc";
    ASSERT_TRUE(FileSystem::CopyFile(written, here));
    auto const book = m_Books.NewBook({elsewhere, here});
    ASSERT_TRUE(Package(book, "kvdoc")->GetResult().IsSuccess());
    auto const untouched = LoadTestDocument(here, nullptr);
    ASSERT_TRUE(untouched);
    EXPECT_EQ(untouched->GetMetadata()->GetTitle(), "Here");
    auto const packaged = Load(m_Target / "package/whole.kvbook");
    for (int i = 0; i < 2; ++i) {
        auto const document = LoadTestDocument(packaged->GetChapterAtIndex(i)->GetPath(), nullptr);
        ASSERT_TRUE(document);
        EXPECT_EQ(document->GetMetadata()->GetTitle(), i == 0 ? "Elsewhere" : "Here");
    }
}

TEST_F(SaveBookAsPackageTest, AChapterThatFailsKeepsItsPathAndIsToldOf)
{
    String const good = Write("good", {});
    String const gone = Write("gone", {});
    String const last = Write("last", {});
    auto const book = m_Books.NewBook({good, gone, last});
    // While it is open its content can still be had.
    BookBuilder::Rest();
    FileSystem::Delete(gone, 0);
    // The last one's copy can't be put in its place.
    Kernel::DiskFault::SetHandler([](Kernel::DiskOperation operation, String const & path) {
        return operation == Kernel::DiskOperation::Rename && path.View().ends_with("/last.kvdoc") ? EIO : 0;
    });
    auto const command = Package(book, "kvdoc");
    Kernel::DiskFault::SetHandler({});
    EXPECT_TRUE(command->GetResult().IsSuccess()) << "the book file itself is written";
    ASSERT_EQ(command->GetProblems().size(), 2u);
    EXPECT_EQ(command->GetProblems()[0].m_Path, gone);
    EXPECT_EQ(command->GetProblems()[1].m_Path, last);
    EXPECT_FALSE(command->GetProblems()[1].m_Text.Empty());
    auto const packaged = Load(m_Target / "package/whole.kvbook");
    EXPECT_EQ(packaged->GetChapterAtIndex(0)->GetPath(), m_Target / "package/good.kvdoc");
    EXPECT_EQ(packaged->GetChapterAtIndex(1)->GetPath(), gone);
    EXPECT_EQ(packaged->GetChapterAtIndex(2)->GetPath(), last);
    EXPECT_EQ(ChapterPaths(*book), (good + "\n" + gone + "\n" + last + "\n").ToStd());
}

TEST_F(SaveBookAsPackageTest, AnyNameOfAChapterIsOneThere)
{
    // Chapters in folders of their own, one of them below the package's folder, and one of the name of a folder in it.
    std::vector<String> const sources{Write("a/ein kapitel \u00FC", {}), Write("b/two\nlines", {}), Write("c/v1.2", {}),
                                      Write("d/", {}), Write("e/Pictures", {}), Write("f/whole.kvbook", {})};
    FileSystem::CreateFolders(m_Target / "package/chapters");
    String const below = m_Target / "package/chapters/below.kvdoc";
    ASSERT_TRUE(FileSystem::CopyFile(Write("below", {}), below));
    std::vector<String> chapters = sources;
    chapters.push_back(below);
    auto const book = m_Books.NewBook(chapters);
    BookBuilder::Rest();
    auto const command = Package(book, "kvdoc");
    ASSERT_TRUE(command->GetResult().IsSuccess()) << command->GetResult().GetText();
    EXPECT_TRUE(command->GetProblems().empty()) << command->GetProblems()[0].m_Text;
    for (String const & source : chapters) {
        ASSERT_TRUE(FileSystem::Delete(source, 0)) << source << " is where it was";
    }
    String const moved = Move() + "/";
    auto const loaded = Load(moved + "whole.kvbook");
    ASSERT_EQ(loaded->ChapterCount(), static_cast<int>(chapters.size()));
    std::vector<std::string> names;
    for (int i = 0; i < loaded->ChapterCount(); ++i) {
        String const path = loaded->GetChapterAtIndex(i)->GetPath();
        EXPECT_EQ(Kernel::Path::GetFolderWithSeparator(path), moved);
        names.push_back(Kernel::Path::GetFileName(path).ToStd());
        EXPECT_TRUE(LoadTestDocument(path, nullptr)) << path;
    }
    EXPECT_EQ(names, (std::vector<std::string>{"ein kapitel \u00FC.kvdoc", "two\nlines.kvdoc", "v1.2", "chapter.kvdoc",
                                               "Pictures.kvdoc", "whole.kvbook-2", "below.kvdoc"}));
}

TEST_F(SaveBookAsPackageTest, AnOpenChapterGoesAsItIsOnTheScreenAndStaysOpenAndUnsaved)
{
    Book::BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false);
    String const path = Write("open", {});
    auto const book = m_Books.NewBook({path});
    BookBuilder::Rest();
    VantraController & application = VantraController::GetInstance();
    OpenDocumentFailedNotification failure(path, true);
    Counted<DocumentController const> const document = application.OpenDocument(path, failure);
    ASSERT_TRUE(document) << failure.GetReason();
    BookBuilder::Rest(); // The book gives a document that opens its numbers.
    auto const edit = MakeCounted<ModifySectionCommand>(0U);
    edit->SetStartNumberingAt(31);
    ASSERT_TRUE(application.EnqueueCommandAndWait(edit, document, true));
    BookBuilder::Rest();
    ASSERT_TRUE(document->IsDirty());
    ASSERT_TRUE(Package(book, "kvdoc")->GetResult().IsSuccess());
    EXPECT_TRUE(document->IsDirty());
    EXPECT_EQ(document->GetPath(), path);
    EXPECT_TRUE(application.IsActiveDocumentController(document));
    auto const copy = LoadTestDocument(m_Target / "package/open.kvdoc", nullptr);
    ASSERT_TRUE(copy);
    EXPECT_EQ(copy->GetDocument()->GetSection(0)->GetStartNumberingAt(), 31U);
    auto const original = MakeCounted<DocumentController>();
    EXPECT_TRUE(original->LoadDocument(path, false, true, LoadWhole, nullptr, failure, false));
    EXPECT_NE(original->GetDocument()->GetSection(0)->GetStartNumberingAt(), 31U);
    application.EnqueueCommandAndWait(MakeCounted<CloseDocumentCommand>(document, nullptr, false, false));
    Book::BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true);
}

TEST_F(SaveBookAsPackageTest, EveryStepOfTheDiskMayFailWithoutHarmToTheBook)
{
    PictureSettings picture;
    picture.m_Bytes = std::make_shared<std::vector<unsigned char> const>(Png, Png + sizeof(Png));
    picture.m_Entry.m_SourcePath = "/nowhere/dot.png";
    DocumentBuilder builder;
    builder.Settings().m_Pictures.push_back(picture);
    String const first = m_Books.GetFolder() / "first.kvdoc";
    builder.Paragraph("Text.").Picture(DocumentPictures::IdOf(*picture.m_Bytes), 10, 10).BuildFile(first);
    String const second = Write("second", {});
    auto const book = m_Books.NewBook({first, second});
    BookBuilder::Rest();
    auto const contents = [&] {
        return m_Books.GetFolder().ReadFile("first.kvdoc") + m_Books.GetFolder().ReadFile("second.kvdoc");
    };
    std::string const contentsBefore = contents();
    std::string const before = ChapterPaths(*book);
    using Kernel::DiskOperation;
    for (DiskOperation const operation : {DiskOperation::Open, DiskOperation::Read, DiskOperation::Write,
                                          DiskOperation::Flush, DiskOperation::Rename, DiskOperation::CreateFolder}) {
        int harmed = 0;
        bool hasFailed = true;
        // Reads are many, and alike.
        for (int nth = 1; hasFailed; nth += operation == DiskOperation::Read ? 4 : 1) {
            std::filesystem::remove_all((m_Target / "package").ToStd());
            ASSERT_TRUE(FileSystem::CreateFolders(m_Target / "package"));
            book->SetPath("/where/it/was.kvbook");
            book->SetIsDirty(true);
            Counted<SaveBookAsPackageCommand> command;
            {
                Kernel::DiskFaultFromNth const fault(operation, nth, EIO);
                command = Package(book, "kvdoc");
                BookBuilder::Rest();
                hasFailed = nth <= fault.Seen();
            }
            std::string const where =
                "operation " + std::to_string(static_cast<int>(operation)) + ", the " + std::to_string(nth) + ". time";
            bool const isWritten = command->GetResult().IsSuccess();
            EXPECT_EQ(book->IsDirty(), !isWritten) << where;
            EXPECT_EQ(book->GetPath(), isWritten ? m_Target / "package/whole.kvbook" : "/where/it/was.kvbook") << where;
            EXPECT_EQ(ChapterPaths(*book), before) << where;
            harmed += !isWritten || !command->GetProblems().empty();
            for (auto const & problem : command->GetProblems()) {
                EXPECT_FALSE(problem.m_Text.Empty()) << where;
            }
            if (isWritten) {
                // What the package's book names is there: a whole copy, or the chapter itself.
                auto const packaged = Load(m_Target / "package/whole.kvbook");
                for (int i = 0; i < 2; ++i) {
                    EXPECT_TRUE(LoadTestDocument(packaged->GetChapterAtIndex(i)->GetPath(), nullptr)) << where;
                }
            }
        }
        EXPECT_GT(harmed, 0) << static_cast<int>(operation);
    }
    EXPECT_TRUE(contents() == contentsBefore) << "the chapters themselves are left alone";
}

TEST_F(SaveBookAsPackageTest, WithoutItsFolderNothingIsMade)
{
    std::filesystem::remove((m_Target / "package").ToStd());
    auto const book = m_Books.NewBook({Write("a", {})});
    String const before = book->GetPath();
    auto const command = Package(book, "kvdoc");
    EXPECT_EQ(command->GetResult().GetResult(), 28);
    EXPECT_FALSE(command->GetProblems().empty());
    EXPECT_EQ(book->GetPath(), before);
    EXPECT_FALSE(FileSystem::Exists(m_Target / "package"));
}

TEST_F(SaveBookAsPackageTest, PicturesAndFontsGoAlongAndAreNamedByTheirPlaceInThePackage)
{
    // Two pictures of one name, in two chapters.
    std::vector<String> chapters;
    for (int i = 0; i < 2; ++i) {
        std::vector<unsigned char> bytes(Png, Png + sizeof(Png));
        bytes.resize(bytes.size() + static_cast<std::size_t>(i), 0);
        String const source = m_Books.GetFolder().WriteFile(
            std::to_string(i) + "/dot.png", std::string_view(reinterpret_cast<char const *>(bytes.data()), bytes.size()));
        DocumentPictures::Entry entry;
        entry.m_SourcePath = source;
        FileSystem::GetModifiedTime(source, entry.m_SourceTime);
        DocumentBuilder builder;
        auto const held = std::make_shared<std::vector<unsigned char> const>(bytes);
        builder.Paragraph("Text.").Picture(DocumentPictures::IdOf(bytes), 10, 10);
        auto const document = builder.Build();
        document->GetPictures().Add(held, entry);
        chapters.push_back(m_Books.GetFolder() / ("chapter-" + std::to_string(i) + ".kvdoc"));
        SaveTestDocument(*document, chapters.back());
    }
    auto const book = m_Books.NewBook(chapters);
    BookController::ConstChapterList list;
    book->GetChapters(list);
    PackageManagerInfo info;
    SaveBookAsPackageCommand::GetBookInfo(book, list, info);
    EXPECT_EQ(info.GetDocuments(), chapters);
    ASSERT_EQ(info.GetPictures().size(), 2u);
    EXPECT_TRUE(info.GetPictures()[0].m_IsPresent);
    EXPECT_EQ(info.GetPictures()[0].m_Size, sizeof(Png));
    ASSERT_TRUE(std::any_of(info.GetFonts().begin(), info.GetFonts().end(),
                            [](auto const & font) { return font.m_IsUsed && font.m_Family == "EB Garamond"; }));

    auto const command = Package(book, "kvdoc");
    ASSERT_TRUE(command->GetResult().IsSuccess());
    EXPECT_TRUE(command->GetProblems().empty()) << command->GetProblems()[0].m_Text;
    FileSystem::Delete(m_Books.GetFolder() / "0/dot.png", 0);
    String const moved = Move();
    EXPECT_EQ(NamesIn(moved + "/Pictures"), (std::vector<String>{"dot-2.png", "dot.png"}));
    for (int i = 0; i < 2; ++i) {
        auto const document = LoadTestDocument(moved + "/chapter-" + std::to_string(i) + ".kvdoc", nullptr);
        ASSERT_TRUE(document);
        auto const entries = document->GetPictures().GetEntries();
        ASSERT_EQ(entries.size(), 1u);
        String const picture = entries.begin()->second.m_SourcePath;
        EXPECT_EQ(picture, moved + (i == 0 ? "/Pictures/dot.png" : "/Pictures/dot-2.png"));
        Kernel::TimeStamp time;
        ASSERT_TRUE(FileSystem::GetModifiedTime(picture, time));
        EXPECT_EQ(time, entries.begin()->second.m_SourceTime) << "it does not pass for a changed one";
        EXPECT_TRUE(document->GetPictures().GetBytes(entries.begin()->first));
    }
    std::size_t used = 0;
    for (PackageManagerInfo::Font const & font : info.GetFonts()) {
        used += font.m_IsUsed && font.m_MayCollect;
    }
    EXPECT_EQ(NamesIn(moved + "/Fonts").size(), used);
}

TEST_F(SaveBookAsPackageTest, AMachineWithoutTheFontUsesThatOfThePackage)
{
    // Fontconfig of a child is told of no font at all: what the document finds then comes from the package.
    String const folder = m_Target / "package/Fonts";
    ASSERT_TRUE(FileSystem::CreateFolders(folder));
    auto & library = Typeset::FontLibrary::GetInstance();
    String const file = library.Find("EB Garamond", 400, false).m_Face->GetPath();
    ASSERT_TRUE(FileSystem::CopyFile(file, folder + "/own.otf"));
    String const config = m_Target.WriteFile("fonts.conf", "<fontconfig></fontconfig>");
    // In a new process image, so that nothing is known from before.
    std::optional<int> const found = RunInChild([&] {
        ::setenv("FONTCONFIG_FILE", config.c_str(), 1);
        ::setenv("KORVANE_TEST_FONTS", folder.c_str(), 1);
        ::execl("/proc/self/exe", "test", "--gtest_also_run_disabled_tests",
                "--gtest_filter=SaveBookAsPackageTest.DISABLED_FindsTheFontOfAFolder", static_cast<char *>(nullptr));
        return 100;
    });
    EXPECT_EQ(found, 0);
}

TEST_F(SaveBookAsPackageTest, DISABLED_FindsTheFontOfAFolder)
{
    char const * const folder = ::getenv("KORVANE_TEST_FONTS");
    if (!folder) {
        GTEST_SKIP() << "run by AMachineWithoutTheFontUsesThatOfThePackage";
    }
    auto & library = Typeset::FontLibrary::GetInstance();
    EXPECT_FALSE(library.Find("EB Garamond", 400, false).m_FamilyFound);
    library.AddFolder(folder);
    Typeset::FontMatch const match = library.Find("EB Garamond", 400, false);
    EXPECT_TRUE(match.m_FamilyFound);
    ASSERT_TRUE(match.m_Face);
    EXPECT_EQ(match.m_Face->GetPath(), String(folder) + "/own.otf");
    auto const pinned = library.FromFileAndHash("/nowhere/own.otf", 0, match.m_Face->GetHash());
    EXPECT_EQ(pinned, match.m_Face);
}

TEST_F(SaveBookAsPackageTest, ReadersRunWhileABookIsWritten)
{
    auto const book = m_Books.NewBook({Write("a", {})});
    book->SetPath(m_Target / "book.kvbook");
    std::string const before = ChapterPaths(*book);
    for (bool const package : {false, true}) {
        std::atomic<bool> isAsked{false};
        std::atomic<bool> hasRead{false};
        std::thread reader;
        std::promise<std::string> seen;
        Kernel::DiskFault::SetHandler([&](Kernel::DiskOperation operation, String const & path) {
            if (operation == Kernel::DiskOperation::Write && path.View().find(".kvbook") != std::string_view::npos &&
                !isAsked.exchange(true)) {
                reader = std::thread([&] {
                    book->AcquireReaderLock();
                    seen.set_value(ChapterPaths(*book));
                    book->ReleaseReaderLock();
                });
                // The write goes on only when the reader is through; a minute is for a machine that hangs.
                hasRead = seen.get_future().wait_for(std::chrono::minutes(1)) == std::future_status::ready;
            }
            return 0;
        });
        if (package) {
            ASSERT_TRUE(Package(book, "kvdoc")->GetResult().IsSuccess());
        } else {
            BookBuilder::Run(book, MakeCounted<Book::SaveBookCommand>(false));
        }
        Kernel::DiskFault::SetHandler({});
        ASSERT_TRUE(isAsked);
        reader.join();
        EXPECT_TRUE(hasRead) << "the writer lock was not given up";
        EXPECT_EQ(ChapterPaths(*book), before);
    }
}
