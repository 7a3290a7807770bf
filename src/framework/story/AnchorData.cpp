#include "framework/story/AnchorData.h"

#include "framework/kernel/HashAccumulator.h"
#include "framework/story/ByteStream.h"

namespace Story
{

String AnchorData::GetUid() const
{
    std::lock_guard const lock(m_UidLock);
    return m_Uid;
}

void AnchorData::SetUid(String const & uid)
{
    std::lock_guard const lock(m_UidLock);
    m_Uid = uid;
}

void AnchorData::Save(ByteWriter & out) const
{
    out.WriteString(m_Name);
    out.WriteString(GetUid());
    out.WriteBool(m_IsPDFBookmark);
    out.WriteBool(m_IsTOCEntry);
    out.Write(static_cast<std::int32_t>(m_Level));
}

Kernel::Counted<AnchorData> AnchorData::Load(ByteReader & in)
{
    auto name = in.ReadString();
    auto uid = in.ReadString();
    bool const isPDFBookmark = in.ReadBool();
    bool const isTOCEntry = in.ReadBool();
    int const level = in.Read<std::int32_t>();
    return Kernel::MakeCounted<AnchorData>(std::move(name), isPDFBookmark, isTOCEntry, std::move(uid), level);
}

void AnchorData::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    // The uid is left out: it is assigned when a document joins a book, and nothing moves on the page.
    hash.Add(m_Name);
    hash.Add(m_IsPDFBookmark);
    hash.Add(m_IsTOCEntry);
    hash.Add(m_Level);
}

}
