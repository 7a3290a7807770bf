#include "support/ArchiveBuilder.h"

#include <gtest/gtest.h>

using namespace Kernel;
using Level = FileStoreCompressionHintGeneral::CompressionLevel;

ArchiveBuilder & ArchiveBuilder::Deflated(std::string_view name, std::string_view content)
{
    m_Items.emplace_back(String(name), Level::Fast, std::string(content));
    return *this;
}

ArchiveBuilder & ArchiveBuilder::Stored(std::string_view name, std::string_view content)
{
    m_Items.emplace_back(String(name), Level::Stored, std::string(content));
    return *this;
}

Counted<Archive> ArchiveBuilder::Write(String const & path, FileLock * ownLock) const
{
    Archive::CreateResult result;
    Counted<Archive> archive = Archive::CreateWithTemporary(path, m_Type, result, ownLock);
    if (!archive) {
        ADD_FAILURE() << "cannot create " << path << ": " << result.m_Text;
        return nullptr;
    }
    ArchiveSessionHandle session;
    EXPECT_EQ(Archive::SessionResult::Success,
              archive->CreateSessionAdv(session, Archive::SessionType::Whole, nullptr, true));
    for (auto const & [name, level, content] : m_Items) {
        session->SaveBytes(name, FileStoreCompressionHintGeneral(level, CompressionPredictorType::None, 0),
                           MakeCounted<RawData>(RawData::Bytes(content.begin(), content.end())));
    }
    archive->CloseSession(session, false);
    return archive;
}
