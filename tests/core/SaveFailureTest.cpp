#include "core/BookController.h"

#include "framework/document/DocumentSaveResult.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/kernel/Archive.h"
#include "framework/kernel/DiskFault.h"
#include "framework/kernel/FileInStream.h"
#include "framework/kernel/FileSystem.h"
#include "framework/raster/DynamicBitmap.h"
#include "framework/render/FileExportOptions.h"
#include "support/ArchiveBuilder.h"
#include "support/Child.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <fstream>
#include <functional>
#include <optional>
#include <new>
#include <random>
#include <sched.h>
#include <stdexcept>
#include <sys/mount.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <time.h>
#include <unistd.h>

using Book::BookController;
using Kernel::Counted;
using Kernel::DiskFault;
using Kernel::DiskFaultFromNth;
using Kernel::DiskOperation;
using Kernel::MakeCounted;

namespace
{

constexpr Kernel::IDTag BookType("KvBk");

Counted<BookController> MakeBook(int chapters)
{
    auto const book = MakeCounted<BookController>();
    for (int i = 0; i < chapters; ++i) {
        book->AddChapter(String("/nowhere/chapter-" + std::to_string(i) + ".kvdoc"), -1);
    }
    return book;
}

int SaveCode(BookController & book, String const & path)
{
    DocumentSaveResult saved;
    book.SaveBookAsCopy(saved, path);
    return saved.GetResult();
}

int LoadCode(String const & path, int * chapters)
{
    auto const book = MakeCounted<BookController>();
    auto const failure = MakeCounted<OpenDocumentFailedNotification>(path, false);
    bool const loaded = book->LoadBook(path, *failure);
    book->DisableCommandEnqueueAndEmpty();
    EXPECT_EQ(loaded, failure->GetResult() == 0);
    if (chapters) {
        *chapters = book->ChapterCount();
    }
    return failure->GetResult();
}

std::vector<String> NamesIn(TemporaryFolder const & folder)
{
    std::vector<String> names;
    EXPECT_TRUE(Kernel::FileSystem::ListFolder(folder.GetPath(), names));
    return names;
}

/// Options that do something while they are written: they stand for whatever a book file takes from elsewhere.
class BusyOptions final : public Renderer::FileExportOptions
{
public:
    explicit BusyOptions(std::function<void()> work) : m_Work(std::move(work)) {}

    [[nodiscard]] String GetExtension() const override { return "none"; }
    void Save(Kernel::OutSerialiser &) const override { m_Work(); }
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override
    {
        return Renderer::FileExportOptionsPDF::GetTypeClassProperties();
    }

private:
    std::function<void()> m_Work;
};

class SaveFailureTest : public testing::Test
{
protected:
    void SetUp() override
    {
        ASSERT_EQ(SaveCode(*MakeBook(1), m_Path), 0);
        m_Old = m_Folder.ReadFile("book.kvbook");
        m_Book = MakeBook(2);
        m_Book->SetPath("/where/it/was.kvbook");
        ::chmod(m_Folder.GetPath().c_str(), 0755);
    }

    /// A save that failed: the code, and nothing changed.
    void ExpectFailure(DocumentSaveResult const & saved, int code, char const * why)
    {
        EXPECT_EQ(saved.GetResult(), code) << why;
        EXPECT_FALSE(saved.IsSuccess()) << why;
        EXPECT_FALSE(saved.GetText().Empty()) << why << ": the user is told why";
        EXPECT_TRUE(m_Book->IsDirty()) << why;
        EXPECT_EQ(m_Book->GetPath(), "/where/it/was.kvbook") << why;
        EXPECT_EQ(m_Folder.ReadFile("book.kvbook"), m_Old) << why;
    }

    TemporaryFolder const m_Folder;
    String const m_Path = m_Folder / "book.kvbook";
    std::string m_Old;
    Counted<BookController> m_Book;
};

}

TEST_F(SaveFailureTest, ATargetThatCannotBeMadeHasACodeForEachReason)
{
    Kernel::FileSystem::CreateFolders(m_Folder / "folder");
    ::mkfifo((m_Folder / "pipe").c_str(), 0666);
    ASSERT_EQ(::symlink("loop", (m_Folder / "loop").c_str()), 0);
    struct Row
    {
        char const * m_Why;
        String m_Path;
        int m_Errno;
        int m_Code;
    };
    // With a number the system itself says so when the new file is made.
    Row const rows[] = {
        {"nobody has heard of it", m_Path, EPROTO, 20}, {"it leads to itself", m_Folder / "loop", 0, 20},
        {"its folder is missing", m_Folder / "none/b.kvbook", 0, 28},
        {"a folder has the name", m_Folder / "folder", 0, 30}, {"there is no name", String(), 0, 30},
        {"a folder's name", m_Folder / "new/", 0, 30}, {"a pipe has the name", m_Folder / "pipe", 0, 21},
        {"the name is too long", m_Folder / std::string(300, 'n'), 0, 29}, {"memory is short", m_Path, ENOMEM, 2},
        {"the system denies it", m_Path, EPERM, 21}, {"no permission", m_Path, EACCES, 22},
        {"the disk is read-only", m_Path, EROFS, 23}, {"too many files are open", m_Path, ENFILE, 40},
        {"the quota is used up", m_Path, EDQUOT, 41}, {"it is in use", m_Path, ETXTBSY, 42},
        {"the disk is full", m_Path, ENOSPC, 3}, {"the disk fails", m_Path, EIO, 43},
    };
    for (Row const & row : rows) {
        DocumentSaveResult saved;
        {
            std::optional<DiskFaultFromNth> fault;
            if (row.m_Errno != 0) {
                // The first opening is for a look at the target's lock.
                fault.emplace(DiskOperation::Open, 2, row.m_Errno);
            }
            m_Book->SaveBookAsCopy(saved, row.m_Path);
        }
        ExpectFailure(saved, row.m_Code, row.m_Why);
        EXPECT_TRUE(saved.ConcernsFile()) << row.m_Why;
    }
    EXPECT_EQ(NamesIn(m_Folder), (std::vector<String>{"book.kvbook", "folder", "loop", "pipe"}));
}

TEST_F(SaveFailureTest, PermissionsCount)
{
    // Nobody but root gets past these.
    ::chmod(m_Path.c_str(), 0666);
    EXPECT_EQ(RunAsPlainUser([&] { return SaveCode(*m_Book, m_Path); }), 22) << "the folder is another's";
    ::chmod(m_Folder.GetPath().c_str(), 0777);
    EXPECT_EQ(RunAsPlainUser([&] { return SaveCode(*m_Book, m_Folder / "new.kvbook"); }), 0);
    ::chmod(m_Path.c_str(), 0444);
    EXPECT_EQ(RunAsPlainUser([&] { return SaveCode(*m_Book, m_Path); }), 22) << "the file is marked read-only";
    ::chmod(m_Path.c_str(), 0);
    EXPECT_EQ(RunAsPlainUser([&] { return LoadCode(m_Path, nullptr); }), OpenDocumentFailedNotification::AccessDenied);
    ::chmod(m_Path.c_str(), 0644);
    EXPECT_EQ(m_Folder.ReadFile("book.kvbook"), m_Old);
}

TEST_F(SaveFailureTest, AnotherProcessKeepsUsOutByItsLock)
{
    for (auto const mode : {Kernel::Archive::OpenMode::Read, Kernel::Archive::OpenMode::ReadExclusive}) {
        HoldingChild const other([&] {
            Kernel::Archive::OpenResult result{};
            auto const archive = Kernel::Archive::Open(m_Path, mode, BookType, result);
            return [archive] {};
        });
        DocumentSaveResult saved;
        m_Book->SaveBookAsCopy(saved, m_Path);
        ExpectFailure(saved, 27, "open in another process");
        EXPECT_EQ(LoadCode(m_Path, nullptr), mode == Kernel::Archive::OpenMode::Read
                                                 ? OpenDocumentFailedNotification::Success
                                                 : OpenDocumentFailedNotification::LockedByOther);
    }
    EXPECT_EQ(SaveCode(*m_Book, m_Path), 0) << "a process that has ended holds nothing";
}

TEST_F(SaveFailureTest, LimitsOfTheProcessAreToldApart)
{
    EXPECT_EQ(RunInChild([&] {
                  rlimit const none{3, 3};
                  ::setrlimit(RLIMIT_NOFILE, &none);
                  return SaveCode(*m_Book, m_Path);
              }),
              40);
    EXPECT_EQ(RunInChild([&] {
                  ::signal(SIGXFSZ, SIG_IGN);
                  rlimit const small{100, 100};
                  ::setrlimit(RLIMIT_FSIZE, &small);
                  return SaveCode(*m_Book, m_Path);
              }),
              5);
    EXPECT_EQ(m_Folder.ReadFile("book.kvbook"), m_Old);
    EXPECT_EQ(NamesIn(m_Folder), std::vector<String>{"book.kvbook"});
}

TEST_F(SaveFailureTest, ARealDiskThatIsFullOrReadOnlyKeepsTheOldBook)
{
    constexpr int NoDisk = 199;
    constexpr int Harmed = 198;
    String const disk = m_Folder / "disk";
    ASSERT_TRUE(Kernel::FileSystem::CreateFolders(disk));
    auto const noise = MakeCounted<Raster::DynamicBitmap>();
    noise->Create(100, 100, Raster::Format::Rgba8, Raster::MipmapMode::OnDemand, Raster::HardwareCachePolicy::Default);
    std::minstd_rand random(20261121);
    for (int y = 0; y < noise->GetHeight(); ++y) {
        std::generate_n(noise->GetRow(y), noise->GetRowBytes(),
                        [&random] { return static_cast<std::uint8_t>(random()); });
    }
    struct Row
    {
        char const * m_Why;
        unsigned long m_Remount;
        int m_Code;
    };
    for (Row const & row : {Row{"full", 0, 3}, Row{"read-only", MS_REMOUNT | MS_RDONLY, 23}}) {
        std::optional<int> const code = RunInChild([&] {
            // A disk of a few pages that only this process sees.
            bool const isRoot = ::geteuid() == 0;
            std::string const ids = "0 " + std::to_string(::geteuid()) + " 1";
            if (::unshare(isRoot ? CLONE_NEWNS : CLONE_NEWNS | CLONE_NEWUSER) != 0 ||
                (!isRoot && !(std::ofstream("/proc/self/uid_map") << ids << std::flush)) ||
                ::mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
                ::mount("tmpfs", disk.c_str(), "tmpfs", 0, "size=16k") != 0) {
                return NoDisk;
            }
            String const path = disk + "/book.kvbook";
            int chapters = 0;
            if (SaveCode(*MakeBook(1), path) != 0 ||
                (row.m_Remount != 0 && ::mount("tmpfs", disk.c_str(), "tmpfs", row.m_Remount, nullptr) != 0)) {
                return NoDisk;
            }
            auto const large = MakeBook(2);
            large->UpdateThumbnail(noise);
            int const failed = SaveCode(*large, path);
            std::vector<String> names;
            Kernel::FileSystem::ListFolder(disk, names);
            bool const isWhole = LoadCode(path, &chapters) == 0 && chapters == 1 && names.size() == 1;
            return isWhole ? failed : Harmed;
        });
        if (code == NoDisk) {
            GTEST_SKIP() << "no disk can be made here";
        }
        EXPECT_EQ(code, row.m_Code) << row.m_Why;
    }
}

TEST_F(SaveFailureTest, AFailureWhileTheFileIsWrittenHasACodeForEachReason)
{
    struct Row
    {
        int m_Errno;
        int m_Code;
    };
    for (Row const & row : {Row{EIO, 10}, Row{EINVAL, 10}, Row{ENOSPC, 3}, Row{EDQUOT, 4}, Row{EFBIG, 5},
                            Row{EACCES, 22}, Row{EPERM, 21}, Row{EAGAIN, 27}}) {
        // A flush takes an EINVAL for a pipe's answer.
        for (DiskOperation const operation : {DiskOperation::Write, DiskOperation::Rename}) {
            DocumentSaveResult saved;
            {
                DiskFaultFromNth const fault(operation, 1, row.m_Errno);
                m_Book->SaveBookAsCopy(saved, m_Path);
            }
            ExpectFailure(saved, row.m_Code, std::to_string(row.m_Errno).c_str());
            EXPECT_TRUE(saved.ConcernsFile());
            EXPECT_TRUE(saved.GetOtherArchivePath().Empty());
        }
    }
    EXPECT_EQ(NamesIn(m_Folder), std::vector<String>{"book.kvbook"});
}

TEST_F(SaveFailureTest, AnOldFileThatCannotBeReadIsReplacedAndANewOneThatCannotIsNot)
{
    // The same length, so that the contents are compared.
    m_Book = MakeBook(1);
    m_Book->SetPath("/where/it/was.kvbook");
    {
        DocumentSaveResult saved;
        DiskFaultFromNth const fault(DiskOperation::Read, 1, EIO);
        m_Book->SaveBookAsCopy(saved, m_Path);
        ExpectFailure(saved, 15, "what was just written can't be read");
    }
    DiskFault::SetHandler([this](DiskOperation operation, String const & path) {
        return operation == DiskOperation::Read && path == m_Path ? EIO : 0;
    });
    int const code = SaveCode(*m_Book, m_Path);
    DiskFault::SetHandler({});
    EXPECT_EQ(code, 0);
}

TEST_F(SaveFailureTest, WhatFailsInsideOfAnItemHasItsOwnCodes)
{
    String const otherPath = m_Folder / "other.kvdoc";
    ArchiveBuilder("KvDc").Stored("doc.dat", "content").Write(otherPath);
    Kernel::Archive::OpenResult opened{};
    auto const other = Kernel::Archive::Open(otherPath, Kernel::Archive::OpenMode::Read, "KvDc", opened);
    auto const readOther = [&other] {
        DiskFaultFromNth const fault(DiskOperation::Read, 1, EIO);
        static_cast<void>(other->ReadItem("doc.dat"));
    };
    auto const readFile = [&otherPath](int error) {
        return [&otherPath, error] {
            DiskFaultFromNth const fault(DiskOperation::Read, 1, error);
            static_cast<void>(Kernel::FileInStream::Open(otherPath.c_str(), true)->ReadAll());
        };
    };
    auto const writeFile = [&] {
        DiskFaultFromNth const fault(DiskOperation::Write, 1, EINVAL);
        Kernel::File file;
        file.OpenEx((m_Folder / "scratch").c_str(), "wb", Kernel::File::ShareMode::Shared,
                    Kernel::File::VisibilityMode::Normal);
        file.Write("x", 1);
    };
    struct Row
    {
        char const * m_Why;
        std::function<void()> m_Work;
        int m_Code;
        bool m_ConcernsFile;
    };
    Row const rows[] = {
        {"another archive", readOther, 34, true},
        {"a file that can't be written", writeFile, 10, true},
        {"a file that is denied", readFile(EPERM), 21, true},
        {"a file without permission", readFile(EACCES), 22, true},
        {"no space", readFile(ENOSPC), 3, true},
        {"a failing disk", readFile(EIO), 10, true},
        {"a file that can't be read", readFile(EINVAL), 44, true},
        {"memory", [] { throw std::bad_alloc(); }, 2, false},
        {"an item that is no good", [] { throw Kernel::Exception("it is no good"); }, 39, false},
        {"anything else", [] { throw std::runtime_error("unheard of"); }, 38, false},
    };
    for (Row const & row : rows) {
        m_Book->SetExportOptions(
            Kernel::Consolidated<Renderer::FileExportOptions>(MakeCounted<BusyOptions>(row.m_Work)));
        DocumentSaveResult saved;
        m_Book->SaveBookAsCopy(saved, m_Path);
        ExpectFailure(saved, row.m_Code, row.m_Why);
        EXPECT_EQ(saved.ConcernsFile(), row.m_ConcernsFile) << row.m_Why;
        EXPECT_EQ(saved.GetOtherArchivePath(), row.m_Code == 34 ? otherPath : String()) << row.m_Why;
    }
}

TEST_F(SaveFailureTest, ABookWhoseNewFileIsTakenAwayHasNoPathAfterwards)
{
    // What a killed process has left is cleared away between making the new file and beginning to write it.
    m_Folder.WriteFile(".book.kvbook-1-1.kvtmp", "left");
    DiskFault::SetHandler([this](DiskOperation operation, String const & path) {
        if (operation == DiskOperation::Delete) {
            for (String const & name : NamesIn(m_Folder)) {
                if (name.View().ends_with(".kvtmp") && !path.View().ends_with(name.View())) {
                    ::unlink((m_Folder / name.View()).c_str());
                }
            }
        }
        return 0;
    });
    DocumentSaveResult saved;
    m_Book->SaveBookAsCopy(saved, m_Path);
    DiskFault::SetHandler({});
    EXPECT_EQ(saved.GetResult(), 38);
    EXPECT_TRUE(m_Book->GetPath().Empty()) << "the next save asks for a name";
    EXPECT_EQ(m_Book->GetName(1, false), "Untitled");
    EXPECT_TRUE(m_Book->IsDirty());
    EXPECT_EQ(m_Folder.ReadFile("book.kvbook"), m_Old);
    EXPECT_EQ(SaveCode(*m_Book, m_Book->GetPath()), 30);
}

TEST_F(SaveFailureTest, EveryStepOfTheDiskMayFailWithoutHarm)
{
    for (DiskOperation const operation :
         {DiskOperation::Open, DiskOperation::Write, DiskOperation::Flush, DiskOperation::Rename}) {
        int failures = 0;
        bool hasFailed = true;
        for (int nth = 1; hasFailed; ++nth) {
            DocumentSaveResult saved;
            {
                DiskFaultFromNth const fault(operation, nth, EIO);
                m_Book->SaveBookAsCopy(saved, m_Path);
                hasFailed = nth <= fault.Seen();
            }
            if (saved.IsSuccess()) {
                // The folder could not be flushed, or a look at the old file failed: what counts was done.
                EXPECT_FALSE(m_Book->IsDirty());
                EXPECT_NE(m_Folder.ReadFile("book.kvbook"), m_Old);
                m_Book->SetPath("/where/it/was.kvbook");
                m_Book->SetIsDirty(true);
                m_Folder.WriteFile("book.kvbook", m_Old);
            } else {
                ++failures;
                ExpectFailure(saved, saved.GetResult(), "a step failed");
                EXPECT_NE(saved.GetResult(), 0);
            }
            EXPECT_EQ(NamesIn(m_Folder), std::vector<String>{"book.kvbook"})
                << "operation " << static_cast<int>(operation) << ", the " << nth << ". time";
        }
        EXPECT_GE(failures, 1) << static_cast<int>(operation);
    }
    // File and folder both reach the disk.
    DiskFaultFromNth const count(DiskOperation::Flush, 1000, EIO);
    EXPECT_EQ(SaveCode(*m_Book, m_Path), 0);
    EXPECT_EQ(count.Seen(), 2);
}

TEST_F(SaveFailureTest, OpeningTellsTheReasonsApart)
{
    using Failed = OpenDocumentFailedNotification;
    Kernel::FileSystem::CreateFolders(m_Folder / "folder");
    ::mkfifo((m_Folder / "pipe").c_str(), 0666);
    std::string newer = m_Old;
    std::size_t const version = newer.find(";v=1");
    ASSERT_NE(version, std::string::npos);
    newer[version + 3] = '2';
    m_Folder.WriteFile("newer.kvbook", newer);
    EXPECT_EQ(LoadCode(m_Folder / "folder", nullptr), Failed::NotADocument);
    EXPECT_EQ(LoadCode(m_Folder / "pipe", nullptr), Failed::NotADocument) << "nobody waits for its other end";
    EXPECT_EQ(LoadCode(m_Folder / "newer.kvbook", nullptr), Failed::FutureVersion);
    EXPECT_EQ(LoadCode(m_Folder / "none/book.kvbook", nullptr), Failed::FileNotFound);
    ASSERT_EQ(::symlink("loop.kvbook", (m_Folder / "loop.kvbook").c_str()), 0);
    EXPECT_EQ(LoadCode(m_Folder / "loop.kvbook", nullptr), Failed::FileNotFound);
    {
        DiskFaultFromNth const fault(DiskOperation::Open, 1, EMFILE);
        EXPECT_EQ(LoadCode(m_Path, nullptr), Failed::OutOfResources);
    }
    // The disk fails while the file is looked at, and later while the book is read.
    std::vector<int> codes;
    for (int nth = 1, code = -1; code != 0; ++nth) {
        DiskFaultFromNth const fault(DiskOperation::Read, nth, EIO);
        code = LoadCode(m_Path, nullptr);
        if (codes.empty() || codes.back() != code) {
            codes.push_back(code);
        }
    }
    EXPECT_EQ(codes, (std::vector<int>{Failed::CannotReadFile, Failed::NotADocument, Failed::Success}));
}

TEST_F(SaveFailureTest, AFileCutOffOrWithOneByteChangedOpensAsItWasOrFailsWithACode)
{
    String const path = m_Folder / "damaged.kvbook";
    for (std::size_t length = 0; length < m_Old.size(); ++length) {
        m_Folder.WriteFile("damaged.kvbook", std::string_view(m_Old).substr(0, length));
        EXPECT_NE(LoadCode(path, nullptr), 0) << "cut to " << length << " bytes";
    }
    int noticed = 0;
    for (std::size_t at = 0; at < m_Old.size(); ++at) {
        for (unsigned const flip : {0x01U, 0x80U, 0xFFU}) {
            std::string damaged = m_Old;
            damaged[at] = static_cast<char>(static_cast<unsigned char>(damaged[at]) ^ flip);
            m_Folder.WriteFile("damaged.kvbook", damaged);
            int chapters = 0;
            int const code = LoadCode(path, &chapters);
            noticed += code != 0;
            EXPECT_TRUE(code != 0 || chapters == 1) << "byte " << at << " changed by " << flip;
        }
    }
    EXPECT_GT(noticed, static_cast<int>(m_Old.size()));
}

TEST_F(SaveFailureTest, AProcessThatIsKilledWhileItSavesLeavesOneVersionOrTheOther)
{
    constexpr int Few = 1;
    constexpr int Many = 40;
    // Made here: a child has no more threads to help it.
    Counted<BookController> const books[] = {MakeBook(Few), MakeBook(Many)};
    unsigned random = 20261121;
    int changes = 0;
    int last = Few;
    for (int kill = 0; kill < 500; ++kill) {
        random = random * 1664525U + 1013904223U;
        long const nanoseconds = static_cast<long>(random >> 8) % 3'000'000 + 1;
        int const process = ::fork();
        ASSERT_GE(process, 0);
        if (process == 0) {
            sigevent event = {};
            event.sigev_notify = SIGEV_SIGNAL;
            event.sigev_signo = SIGKILL;
            timer_t timer;
            itimerspec const when{{0, 0}, {0, nanoseconds}};
            if (::timer_create(CLOCK_MONOTONIC, &event, &timer) != 0 || ::timer_settime(timer, 0, &when, nullptr) != 0) {
                ::_exit(1);
            }
            for (int i = last == Few ? 1 : 0;; i = 1 - i) {
                SaveCode(*books[i], m_Path);
            }
        }
        int status = 0;
        ASSERT_EQ(::waitpid(process, &status, 0), process);
        ASSERT_TRUE(WIFSIGNALED(status));
        int chapters = 0;
        ASSERT_EQ(LoadCode(m_Path, &chapters), 0) << "after " << kill << " kills";
        ASSERT_TRUE(chapters == Few || chapters == Many) << chapters;
        changes += chapters != last;
        last = chapters;
        if (kill % 25 == 24) {
            ASSERT_EQ(SaveCode(*books[0], m_Path), 0);
            ASSERT_EQ(NamesIn(m_Folder), std::vector<String>{"book.kvbook"}) << "a save that ends clears up for the others";
            last = Few;
        }
    }
    EXPECT_GT(changes, 0) << "some came through";
}

TEST_F(SaveFailureTest, ASaveRemovesNothingButItsOwnLeftovers)
{
    char const * const others[] = {".book.kvbook-2-1-1.kvtmp", ".book.kvbook-.kvtmp", ".book.kvbook-1-x.kvtmp",
                                   ".other.kvbook-1-1.kvtmp", "book.kvbook-1-1.kvtmp"};
    for (char const * const name : others) {
        m_Folder.WriteFile(name, "mine");
    }
    m_Folder.WriteFile(".book.kvbook-4711-2.kvtmp", "left by one that was killed");
    EXPECT_EQ(SaveCode(*m_Book, m_Path), 0);
    for (char const * const name : others) {
        EXPECT_EQ(m_Folder.ReadFile(name), "mine");
    }
    EXPECT_EQ(NamesIn(m_Folder).size(), std::size(others) + 1);
}
