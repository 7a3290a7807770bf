#include "framework/story/HyperlinkData.h"

#include "framework/kernel/HashAccumulator.h"
#include "framework/story/ByteStream.h"

namespace Story
{

Kernel::Counted<HyperlinkData const> HyperlinkData::ToWeb(String const & address)
{
    Fields fields;
    fields.m_Type = Type::Web;
    fields.m_Path = address;
    return Kernel::MakeCounted<HyperlinkData const>(std::move(fields));
}

Kernel::Counted<HyperlinkData const> HyperlinkData::ToAnchor(String const & uid, String const & targetText)
{
    Fields fields;
    fields.m_Type = Type::Anchor;
    fields.m_AnchorUid = uid;
    fields.m_TargetText = targetText;
    return Kernel::MakeCounted<HyperlinkData const>(std::move(fields));
}

void HyperlinkData::Save(ByteWriter & out) const
{
    out.Write(m_Fields.m_Type);
    out.WriteString(m_Fields.m_Path);
    out.WriteString(m_Fields.m_AnchorUid);
    out.WriteString(m_Fields.m_TargetText);
    out.Write(m_Fields.m_PageIndex);
    out.Write(m_Fields.m_SectionIndex);
    out.Write(m_Fields.m_ChapterIndex);
    out.WriteBool(m_Fields.m_IsActive);
    out.WriteBool(m_Fields.m_IsEndnotes);
    out.WriteBool(m_Fields.m_IncludeFileOnExport);
}

Kernel::Counted<HyperlinkData const> HyperlinkData::Load(ByteReader & in)
{
    Fields fields;
    fields.m_Type = in.Read<Type>();
    fields.m_Path = in.ReadString();
    fields.m_AnchorUid = in.ReadString();
    fields.m_TargetText = in.ReadString();
    fields.m_PageIndex = in.Read<std::int32_t>();
    fields.m_SectionIndex = in.Read<std::int32_t>();
    fields.m_ChapterIndex = in.Read<std::int32_t>();
    fields.m_IsActive = in.ReadBool();
    fields.m_IsEndnotes = in.ReadBool();
    fields.m_IncludeFileOnExport = in.ReadBool();
    return Kernel::MakeCounted<HyperlinkData const>(std::move(fields));
}

void HyperlinkData::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    hash.Add(m_Fields.m_Type);
    hash.Add(m_Fields.m_Path);
    hash.Add(m_Fields.m_AnchorUid);
    hash.Add(m_Fields.m_TargetText);
    hash.Add(m_Fields.m_PageIndex);
    hash.Add(m_Fields.m_SectionIndex);
    hash.Add(m_Fields.m_ChapterIndex);
    hash.Add(m_Fields.m_IsActive);
    hash.Add(m_Fields.m_IsEndnotes);
    hash.Add(m_Fields.m_IncludeFileOnExport);
}

}
