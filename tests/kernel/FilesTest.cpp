#include "framework/kernel/DiskFault.h"
#include "framework/kernel/FileInStream.h"
#include "framework/kernel/FileIOException.h"
#include "framework/kernel/FileOutStream.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/TempFile.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <sys/stat.h>
#include <unistd.h>

using namespace Kernel;
using Result = File::OpenUnmanagedResult;

namespace
{

struct CountingHandler : FileStreamErrorHandler
{
    void OnReadError(FileIOException const &) override { ++m_Reads; }
    void OnWriteError(FileIOException const & exception) override
    {
        ++m_Writes;
        m_Reason = exception.GetReason();
    }
    int m_Reads = 0;
    int m_Writes = 0;
    FileIOException::Reason m_Reason{};
};

class FilesTest : public testing::Test
{
protected:
    Counted<FileOutStream> Create(String const & path)
    {
        Result result{};
        auto stream = FileOutStream::Create(path.c_str(), File::ShareMode::RespectLocks, result, nullptr);
        EXPECT_TRUE(stream) << static_cast<int>(result);
        return stream;
    }

    std::size_t CountFiles() const
    {
        std::vector<String> names;
        EXPECT_TRUE(FileSystem::ListFolder(m_Folder.GetPath(), names));
        return names.size();
    }

    TemporaryFolder m_Folder;
};

}

TEST_F(FilesTest, ATargetIsUntouchedUntilCloseAndWholeAfterIt)
{
    String const path = m_Folder.WriteFile("a.pdf", "old");
    std::string const large(500'000, 'x');
    {
        auto const stream = Create(path);
        stream->Write(large.data(), large.size());
        EXPECT_EQ("old", m_Folder.ReadFile("a.pdf"));
    }
    EXPECT_EQ("old", m_Folder.ReadFile("a.pdf")) << "a stream that goes without Close leaves nothing";
    EXPECT_EQ(1u, CountFiles());

    auto const stream = Create(path);
    stream->Write("he", 2);
    stream->Write(large.data(), large.size());
    stream->Write("llo", 3);
    EXPECT_EQ(500'005u, stream->GetPosition());
    EXPECT_TRUE(stream->Close());
    EXPECT_TRUE(stream->Close()) << "once is enough";
    EXPECT_EQ("he" + large + "llo", m_Folder.ReadFile("a.pdf"));
    EXPECT_EQ(1u, CountFiles());
}

TEST_F(FilesTest, AFailureAtAnyOperationIsToldAndLeavesTheTarget)
{
    String const path = m_Folder.WriteFile("a.pdf", "old");
    std::string const large(300'000, 'x');
    struct Row
    {
        DiskOperation m_Operation;
        int m_Error;
        FileIOException::Reason m_Reason;
    };
    Row const rows[] = {
        {DiskOperation::Write, ENOSPC, FileIOException::Reason::OutOfSpace},
        {DiskOperation::Flush, EIO, FileIOException::Reason::DeviceError},
        {DiskOperation::Rename, EACCES, FileIOException::Reason::PermissionDenied},
    };
    for (Row const & row : rows) {
        for (bool const handled : {false, true}) {
            auto const stream = Create(path);
            CountingHandler handler;
            stream->SetErrorHandler(handled ? &handler : nullptr);
            DiskFaultFromNth const fault(row.m_Operation, 1, row.m_Error);
            auto const work = [&] {
                stream->Write(large.data(), large.size());
                EXPECT_FALSE(stream->Close());
            };
            if (handled) {
                work();
                EXPECT_EQ(1, handler.m_Writes) << "told once, later writes are swallowed";
                EXPECT_EQ(row.m_Reason, handler.m_Reason);
            } else {
                EXPECT_THROW(work(), FileIOException);
            }
            ASSERT_TRUE(stream->HasError());
            EXPECT_EQ(row.m_Reason, stream->GetError()->GetReason());
            EXPECT_NE(std::string::npos, stream->GetError()->GetMessage().View().find("a.pdf"));
        }
        EXPECT_EQ("old", m_Folder.ReadFile("a.pdf"));
    }
    EXPECT_EQ(1u, CountFiles());
}

TEST_F(FilesTest, ACopyCanBeStoppedAndAFailingSourceDoesNotLookWhole)
{
    String const source = m_Folder.WriteFile("source", std::string(900'000, 's'));
    String const target = m_Folder / "target";
    struct StopInTheMiddle : StreamCopyProgress
    {
        bool OnProgress(std::uint64_t done, std::uint64_t total) override { return done * 2 < total; }
    } stop;
    EXPECT_FALSE(Create(target)->CopyFromStream(*FileInStream::Open(source.c_str(), true), &stop));
    {
        auto const in = FileInStream::Open(source.c_str(), true);
        auto const out = Create(target);
        CountingHandler handler;
        out->SetErrorHandler(&handler);
        DiskFaultFromNth const fault(DiskOperation::Read, 2, EIO);
        out->CopyFromStream(*in, nullptr);
        EXPECT_EQ(1, handler.m_Reads);
        EXPECT_FALSE(out->Close());
    }
    EXPECT_FALSE(FileSystem::Exists(target));
    auto const out = Create(target);
    EXPECT_TRUE(out->CopyFromStream(*FileInStream::Open(source.c_str(), true), nullptr) && out->Close());
    EXPECT_EQ(m_Folder.ReadFile("source"), m_Folder.ReadFile("target"));
}

TEST_F(FilesTest, WhatCannotBeCreatedHasItsCodeAndASentence)
{
    String const readOnly = m_Folder.WriteFile("read-only", "old");
    ASSERT_EQ(0, ::chmod(readOnly.c_str(), 0444));
    std::vector<std::pair<String, Result>> rows{
        {m_Folder / "none/a.pdf", Result::FolderMissing},
        {m_Folder.GetPath(), Result::IsFolder},
        {m_Folder / std::string(300, 'n'), Result::NameTooLong},
    };
    if (::getuid() != 0) {
        rows.emplace_back(readOnly, Result::PermissionDenied);
    }
    for (auto const & [path, expected] : rows) {
        Result result{};
        String message;
        EXPECT_FALSE(FileOutStream::Create(path.c_str(), File::ShareMode::RespectLocks, result, &message));
        EXPECT_EQ(expected, result) << path;
        EXPECT_NE(std::string::npos, message.View().find(path.View())) << message;
    }
    EXPECT_FALSE(FileInStream::Open((m_Folder / "none").c_str(), false));
    EXPECT_THROW(static_cast<void>(FileInStream::Open((m_Folder / "none").c_str(), true)),
                 File::OpenUnmanagedException);
}

TEST_F(FilesTest, ALinkStaysALinkAndPermissionsStay)
{
    String const path = m_Folder.WriteFile("real", "old");
    ASSERT_EQ(0, ::chmod(path.c_str(), 0640));
    ASSERT_EQ(0, ::symlink("real", (m_Folder / "link").c_str()));
    auto const stream = Create(m_Folder / "link");
    stream->Write("new", 3);
    ASSERT_TRUE(stream->Close());
    struct stat facts;
    ASSERT_EQ(0, ::lstat((m_Folder / "link").c_str(), &facts));
    EXPECT_TRUE(S_ISLNK(facts.st_mode));
    EXPECT_EQ("new", m_Folder.ReadFile("real"));
    ASSERT_EQ(0, ::stat(path.c_str(), &facts));
    EXPECT_EQ(0640u, facts.st_mode & 0777);
}

TEST_F(FilesTest, AProbeTellsWhyAFileCannotBeOpened)
{
    File file;
    auto const probe = [&file](String const & path) {
        return file.OpenEx(path.c_str(), "rb", File::ShareMode::Shared, File::VisibilityMode::Normal);
    };
    String const path = m_Folder.WriteFile("a", "x");
    EXPECT_EQ(Result::Success, probe(path));
    EXPECT_EQ(Result::NotFound, probe(m_Folder / "none"));
    EXPECT_EQ(Result::IsFolder, probe(m_Folder.GetPath()));
    EXPECT_FALSE(file.IsOpen());
    DiskFaultFromNth const fault(DiskOperation::Open, 1, EACCES);
    EXPECT_EQ(Result::PermissionDenied, probe(path));
}

TEST_F(FilesTest, ATemporaryFileIsTheUsersAloneAndGoesWhenAskedTo)
{
    String path;
    {
        auto const stream = TempFile::GenerateTempOutFile(path, "pdf", true);
        ASSERT_TRUE(stream);
        EXPECT_TRUE(path.View().ends_with(".pdf"));
        struct stat facts;
        ASSERT_EQ(0, ::stat(path.c_str(), &facts));
        EXPECT_EQ(0600u, facts.st_mode & 0777);
        stream->Write("x", 1);
        EXPECT_TRUE(stream->Close());
        EXPECT_TRUE(FileSystem::Exists(path)) << "closed, and still there";
    }
    EXPECT_FALSE(FileSystem::Exists(path));
}

TEST_F(FilesTest, CopyRenameAndDeleteKeepWhatTheyPromise)
{
    String const one = m_Folder.WriteFile("one", "1");
    String const two = m_Folder.WriteFile("two", "2");
    EXPECT_FALSE(FileSystem::CopyFile(one, two)) << "an existing target is left alone";
    EXPECT_EQ("2", m_Folder.ReadFile("two"));
    EXPECT_TRUE(FileSystem::CopyFile(one, two, FileSystem::IfExists::Replace));
    EXPECT_EQ("1", m_Folder.ReadFile("two"));
    EXPECT_FALSE(FileSystem::CopyFile(m_Folder.GetPath(), m_Folder / "x"));
    {
        DiskFaultFromNth const fault(DiskOperation::Write, 1, ENOSPC);
        EXPECT_FALSE(FileSystem::CopyFile(one, m_Folder / "three"));
        EXPECT_EQ(ENOSPC, errno);
    }
    EXPECT_FALSE(FileSystem::Exists(m_Folder / "three")) << "no part of a failed copy stays";
    EXPECT_FALSE(FileSystem::Rename(one, two, FileSystem::IfExists::Fail));
    EXPECT_TRUE(FileSystem::Rename(one, m_Folder / "four", FileSystem::IfExists::Fail));
    EXPECT_TRUE(FileSystem::Delete(m_Folder / "four", 0));
    EXPECT_FALSE(FileSystem::Delete(m_Folder / "four", 0));

    EXPECT_TRUE(FileSystem::CreateFolders(m_Folder / "a/b/c") && FileSystem::CreateFolders(m_Folder / "a/b"));
    EXPECT_FALSE(FileSystem::CreateFolders(two)) << "a file is in the way";
    EXPECT_EQ(m_Folder / "a/d", FileSystem::GetCanonicalPath(m_Folder / "a/b/c/../../d"));
    EXPECT_EQ("../two", FileSystem::GetRelativePath(two, m_Folder / "a"));
}
