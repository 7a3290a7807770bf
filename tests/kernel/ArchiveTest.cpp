#include "framework/kernel/Archive.h"

#include "framework/kernel/DiskFault.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "support/ArchiveBuilder.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <csignal>
#include <sys/wait.h>
#include <unistd.h>

using namespace Kernel;

namespace
{

constexpr IDTag Type("KvTe");

std::string TextOf(Counted<RawData const> const & data)
{
    return data ? std::string(reinterpret_cast<char const *>(data->GetData()), data->GetSize()) : "<none>";
}

/// Compressible, and different at every place.
std::string LongText(std::size_t size)
{
    std::string text;
    for (int i = 0; text.size() < size; ++i) {
        text += "paragraph " + std::to_string(i) + " of the chapter\n";
    }
    text.resize(size);
    return text;
}

std::vector<String> NamesIn(TemporaryFolder const & folder)
{
    std::vector<String> names;
    EXPECT_TRUE(FileSystem::ListFolder(folder.GetPath(), names));
    return names;
}

class ArchiveTest : public testing::Test
{
protected:
    Archive::OpenResult Open(String const & path)
    {
        Archive::OpenResult result{};
        m_Archive = Archive::Open(path, Archive::OpenMode::Read, Type, result);
        EXPECT_EQ(result == Archive::OpenResult::Success, static_cast<bool>(m_Archive));
        return result;
    }

    TemporaryFolder m_Folder;
    String const m_Path = m_Folder / "a.kvdoc";
    Counted<Archive> m_Archive;
};

}

TEST_F(ArchiveTest, GivesBackWhatWasWritten)
{
    std::string const text = LongText(300'000);
    ArchiveBuilder(Type).Deflated("doc.dat", text).Stored("layout.dat", text).Deflated("empty", "").Write(m_Path);

    ASSERT_EQ(Archive::OpenResult::Success, Open(m_Path));
    EXPECT_EQ((std::vector<String>{"doc.dat", "layout.dat", "empty"}), m_Archive->GetItemNames());
    EXPECT_EQ(text, TextOf(m_Archive->ReadItem("doc.dat")));
    EXPECT_EQ(text, TextOf(m_Archive->ReadItem("layout.dat")));
    EXPECT_EQ("", TextOf(m_Archive->ReadItem("empty")));
    EXPECT_EQ(300'000u, m_Archive->GetItemSize("doc.dat"));
    EXPECT_FALSE(m_Archive->HasItem("mimetype"));
    EXPECT_EQ(nullptr, m_Archive->ReadItem("other"));
    std::uint64_t size = 0;
    ASSERT_TRUE(FileSystem::GetSize(m_Path, size));
    EXPECT_LT(size, 400'000u) << "one of the two was compressed";
}

TEST_F(ArchiveTest, First64BytesIdentifyTheType)
{
    ArchiveBuilder(Type).Deflated("doc.dat", "x").Write(m_Path);
    std::string const start = m_Folder.ReadFile("a.kvdoc").substr(0, 64);
    EXPECT_EQ("application/x-kv.KvTe;v=1", start.substr(38, 25));
    EXPECT_EQ(Type, Archive::IdentifyType(start.data(), start.size()));
    EXPECT_EQ(std::nullopt, Archive::IdentifyType(start.data(), 50));
    EXPECT_EQ(Type, Archive::IdentifyType(m_Path));
    EXPECT_EQ(std::nullopt, Archive::IdentifyType(m_Folder.WriteFile("other", "plain text")));
}

TEST_F(ArchiveTest, EachKindOfFileThatCannotBeOpenedHasItsOwnResult)
{
    ArchiveBuilder(Type).Deflated("doc.dat", LongText(5000)).Write(m_Path);
    std::string const good = m_Folder.ReadFile("a.kvdoc");
    std::string newer = good;
    newer[good.find(";v=1") + 3] = '2';
    std::string directory = good;
    directory[good.rfind("PK\1\2") + 20] ^= 0x40; // compressed size in the directory, not in the local header
    struct Row
    {
        char const * m_Why;
        std::string m_Content;
        Archive::OpenResult m_Expected;
    };
    Row const rows[] = {
        {"nothing in it", "", Archive::OpenResult::Truncated},
        {"text", "# A chapter\n", Archive::OpenResult::NotAnArchive},
        {"a foreign container", "PK\3\4" + std::string(60, 'x'), Archive::OpenResult::NotAnArchive},
        {"only its first header", good.substr(0, 35), Archive::OpenResult::Truncated},
        {"no directory", good.substr(0, good.size() / 2), Archive::OpenResult::Truncated},
        {"one byte short", good.substr(0, good.size() - 1), Archive::OpenResult::Truncated},
        {"newer container", newer, Archive::OpenResult::NewerVersion},
        {"directory against headers", directory, Archive::OpenResult::Corrupt},
    };
    for (Row const & row : rows) {
        EXPECT_EQ(row.m_Expected, Open(m_Folder.WriteFile("b.kvdoc", row.m_Content))) << row.m_Why;
    }
    Archive::OpenResult result{};
    EXPECT_FALSE(Archive::Open(m_Path, Archive::OpenMode::Read, IDTag("KvBk"), result));
    EXPECT_EQ(Archive::OpenResult::OtherType, result);
    EXPECT_EQ(Archive::OpenResult::Missing, Open(m_Folder / "missing"));
    EXPECT_EQ(Archive::OpenResult::Missing, Open(m_Folder / "a.kvdoc/inside-a-file"));
    EXPECT_EQ(Archive::OpenResult::IsFolder, Open(m_Folder.GetPath()));
    DiskFaultFromNth const denied(DiskOperation::Open, 1, EACCES);
    EXPECT_EQ(Archive::OpenResult::PermissionDenied, Open(m_Path));
}

TEST_F(ArchiveTest, AFlippedBitIsNoticedOrHarmless)
{
    std::string const text = LongText(600);
    ArchiveBuilder(Type).Deflated("doc.dat", text).Stored("layout.dat", text.substr(0, 100)).Write(m_Path);
    std::string const good = m_Folder.ReadFile("a.kvdoc");
    int noticed = 0;
    for (std::size_t at = 0; at < good.size(); ++at) {
        std::string bad = good;
        bad[at] = static_cast<char>(bad[at] ^ (1 << at % 8));
        if (Open(m_Folder.WriteFile("b.kvdoc", bad)) != Archive::OpenResult::Success) {
            ++noticed;
            continue;
        }
        try {
            // An item's name is not covered by a checksum: it may be missing, never wrong.
            Counted<RawData const> const doc = m_Archive->ReadItem("doc.dat");
            Counted<RawData const> const layout = m_Archive->ReadItem("layout.dat");
            EXPECT_TRUE(!doc || TextOf(doc) == text) << "byte " << at;
            EXPECT_TRUE(!layout || TextOf(layout) == text.substr(0, 100)) << "byte " << at;
        } catch (ArchiveCorruptionException const & exception) {
            EXPECT_NE(std::string::npos, exception.GetMessage().View().find("b.kvdoc"));
            ++noticed;
        }
    }
    EXPECT_GT(noticed, static_cast<int>(good.size() / 2));
}

TEST_F(ArchiveTest, SavingTheSameAgainLeavesTheFileAlone)
{
    ArchiveBuilder(Type).Deflated("doc.dat", "one").Write(m_Path);
    TimeStamp before;
    TimeStamp after;
    FileSystem::Identity fileBefore;
    FileSystem::Identity fileAfter;
    ASSERT_TRUE(FileSystem::GetModifiedTime(m_Path, before) && FileSystem::GetIdentity(m_Path, fileBefore));

    EXPECT_TRUE(ArchiveBuilder(Type).Deflated("doc.dat", "one").Write(m_Path)->WasUnchanged());
    ASSERT_TRUE(FileSystem::GetModifiedTime(m_Path, after) && FileSystem::GetIdentity(m_Path, fileAfter));
    EXPECT_EQ(before, after);
    EXPECT_EQ(fileBefore, fileAfter);
}

TEST_F(ArchiveTest, AReplacingSaveMovesTheTimeForwardAlsoPastATimeInTheFuture)
{
    ArchiveBuilder(Type).Deflated("doc.dat", "one").Write(m_Path);
    TimeStamp const future(4'000'000'000'000'000'000);
    ASSERT_TRUE(FileSystem::SetModifiedTime(m_Path, future));
    EXPECT_FALSE(ArchiveBuilder(Type).Deflated("doc.dat", "two").Write(m_Path)->WasUnchanged());
    TimeStamp after;
    ASSERT_TRUE(FileSystem::GetModifiedTime(m_Path, after));
    EXPECT_LT(future, after);
}

TEST_F(ArchiveTest, LocksKeepOthersOutAsTheirKindSays)
{
    ArchiveBuilder(Type).Deflated("doc.dat", "one").Write(m_Path);
    Archive::OpenResult result{};
    {
        Counted<Archive> const reader = Archive::Open(m_Path, Archive::OpenMode::Read, Type, result);
        ASSERT_TRUE(reader);
        EXPECT_TRUE(Archive::Open(m_Path, Archive::OpenMode::Read, Type, result)) << "readers share";
        EXPECT_FALSE(Archive::Open(m_Path, Archive::OpenMode::ReadExclusive, Type, result));
        EXPECT_EQ(Archive::OpenResult::Locked, result);
        Archive::CreateResult created;
        EXPECT_FALSE(Archive::CreateWithTemporary(m_Path, Type, created));
        EXPECT_EQ(Archive::CreateResult::Locked, created.m_Code);
        EXPECT_TRUE(Archive::CreateWithTemporary(m_Path, Type, created, reader->GetLock().Get()))
            << "one's own lock does not count";
        EXPECT_EQ(FileLock::Kind::Shared, reader->GetLock()->GetKind());
    }
    Counted<FileLock> lock;
    {
        Counted<Archive> const front = Archive::Open(m_Path, Archive::OpenMode::ReadExclusive, Type, result);
        ASSERT_TRUE(front);
        lock = front->GetLock();
    }
    EXPECT_EQ(Archive::OpenResult::Locked, Open(m_Path)) << "the lock outlives the archive";
    EXPECT_TRUE(Archive::Open(m_Path, Archive::OpenMode::ReadUnlocked, Type, result));

    Counted<Archive> const saved = ArchiveBuilder(Type).Deflated("doc.dat", "two").Write(m_Path, lock.Get());
    EXPECT_FALSE(lock->IsFor(m_Path)) << "the old lock is on the file that was replaced";
    ASSERT_TRUE(saved->GetLock());
    EXPECT_TRUE(saved->GetLock()->IsFor(m_Path));
    EXPECT_EQ(Archive::OpenResult::Locked, Open(m_Path)) << "no moment without a lock";
}

TEST_F(ArchiveTest, AFailureAtAnyStepOfASaveLeavesTheOldFileAndNoOther)
{
    ArchiveBuilder(Type).Deflated("doc.dat", "old").Write(m_Path);
    struct Row
    {
        DiskOperation m_Operation;
        int m_Error;
        ArchiveFileException::Reason m_Reason;
    };
    Row const rows[] = {
        {DiskOperation::Write, ENOSPC, ArchiveFileException::Reason::OutOfSpace},
        {DiskOperation::Flush, EIO, ArchiveFileException::Reason::DeviceError},
        {DiskOperation::Rename, EACCES, ArchiveFileException::Reason::PermissionDenied},
    };
    for (Row const & row : rows) {
        bool failed = false;
        try {
            DiskFaultFromNth const fault(row.m_Operation, 1, row.m_Error);
            ArchiveBuilder(Type).Stored("doc.dat", LongText(700'000)).Write(m_Path);
        } catch (ArchiveFileException const & exception) {
            failed = true;
            EXPECT_EQ(row.m_Reason, exception.GetReason());
            EXPECT_EQ(m_Path, exception.GetArchive()->GetPath());
            EXPECT_EQ(ArchiveFileException::WhatFile::Written, exception.GetWhatFile());
        }
        EXPECT_TRUE(failed) << static_cast<int>(row.m_Operation);
        ASSERT_EQ(Archive::OpenResult::Success, Open(m_Path));
        EXPECT_EQ("old", TextOf(m_Archive->ReadItem("doc.dat")));
        m_Archive = nullptr;
        EXPECT_EQ(std::vector<String>{"a.kvdoc"}, NamesIn(m_Folder));
    }
}

TEST_F(ArchiveTest, WhatCannotBeCreatedHasItsOwnCode)
{
    Archive::CreateResult result;
    EXPECT_FALSE(Archive::CreateWithTemporary(m_Folder / "none/a.kvdoc", Type, result));
    EXPECT_EQ(Archive::CreateResult::FolderMissing, result.m_Code);
    EXPECT_NE(std::string::npos, result.m_Text.View().find("none"));
    EXPECT_FALSE(Archive::CreateWithTemporary(m_Folder.GetPath(), Type, result));
    EXPECT_EQ(Archive::CreateResult::IsFolder, result.m_Code);
    EXPECT_FALSE(Archive::CreateWithTemporary(m_Folder / std::string(300, 'n'), Type, result));
    EXPECT_EQ(Archive::CreateResult::NameTooLong, result.m_Code);
    std::pair<int, Archive::CreateResult::Code> const faults[] = {
        {EACCES, Archive::CreateResult::PermissionDenied}, {EROFS, Archive::CreateResult::ReadOnlyVolume},
        {ENOSPC, Archive::CreateResult::OutOfSpace},       {EDQUOT, Archive::CreateResult::QuotaExceeded},
        {EMFILE, Archive::CreateResult::TooManyOpenFiles},
    };
    for (auto const & [error, expected] : faults) {
        DiskFaultFromNth const fault(DiskOperation::Open, 1, error);
        EXPECT_FALSE(Archive::CreateWithTemporary(m_Path, Type, result));
        EXPECT_EQ(expected, result.m_Code) << error;
    }
}

TEST_F(ArchiveTest, AnAbortedOrDiscardedSessionLeavesNothing)
{
    Archive::CreateResult created;
    bool abort = true;
    for (bool const discard : {false, true}) {
        Counted<Archive> const archive = Archive::CreateWithTemporary(m_Path, Type, created);
        ArchiveSessionHandle session;
        ASSERT_EQ(Archive::SessionResult::Success,
                  archive->CreateSessionAdv(session, Archive::SessionType::Whole, discard ? nullptr : &abort, false));
        ArchiveSessionHandle second;
        EXPECT_EQ(Archive::SessionResult::NotWritable,
                  archive->CreateSessionAdv(second, Archive::SessionType::Whole, nullptr, false));
        archive->CloseSession(session, discard);
        EXPECT_TRUE(NamesIn(m_Folder).empty());
    }
}

TEST_F(ArchiveTest, AKilledSaveLeavesTheOldFileAndItsRestGoesWithTheNextSave)
{
    ArchiveBuilder(Type).Deflated("doc.dat", "old").Write(m_Path);
    pid_t const child = ::fork();
    ASSERT_LE(0, child);
    if (child == 0) {
        DiskFault::SetHandler([](DiskOperation operation, String const &) {
            if (operation == DiskOperation::Rename) {
                ::kill(::getpid(), SIGKILL);
            }
            return 0;
        });
        ArchiveBuilder(Type).Deflated("doc.dat", "new").Write(m_Path);
        ::_exit(0);
    }
    int status = 0;
    ASSERT_EQ(child, ::waitpid(child, &status, 0));
    ASSERT_TRUE(WIFSIGNALED(status));
    EXPECT_EQ(2u, NamesIn(m_Folder).size());
    ASSERT_EQ(Archive::OpenResult::Success, Open(m_Path));
    EXPECT_EQ("old", TextOf(m_Archive->ReadItem("doc.dat")));
    m_Archive = nullptr;
    ArchiveBuilder(Type).Deflated("doc.dat", "new").Write(m_Path);
    EXPECT_EQ(std::vector<String>{"a.kvdoc"}, NamesIn(m_Folder));
}

TEST_F(ArchiveTest, AReadErrorIsNotTakenForDamage)
{
    ArchiveBuilder(Type).Deflated("doc.dat", LongText(9000)).Write(m_Path);
    {
        DiskFaultFromNth const fault(DiskOperation::Read, 1, EIO);
        EXPECT_EQ(Archive::OpenResult::ReadError, Open(m_Path));
    }
    ASSERT_EQ(Archive::OpenResult::Success, Open(m_Path));
    DiskFaultFromNth const fault(DiskOperation::Read, 1, EIO);
    EXPECT_THROW(static_cast<void>(m_Archive->ReadItem("doc.dat")), ArchiveFileException);
}
