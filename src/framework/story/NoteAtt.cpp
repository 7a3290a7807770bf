#include "framework/story/NoteAtt.h"

#include "framework/kernel/HashAccumulator.h"
#include "framework/story/ByteStream.h"

namespace Story
{

void NoteAtt::CopyFields(NoteAtt const & other, std::uint64_t fields)
{
    if (fields & KindField) {
        m_Kind = other.m_Kind;
    }
    if (fields & RestartField) {
        m_IsRestartNumbering = other.m_IsRestartNumbering;
    }
    if (fields & NumberingModeField) {
        m_NumberingMode = other.m_NumberingMode;
    }
    if (fields & StartNumberingAtField) {
        m_StartNumberingAt = other.m_StartNumberingAt;
    }
}

bool NoteAtt::IsEqual(NoteAtt const & other) const
{
    return m_Kind == other.m_Kind && m_IsRestartNumbering == other.m_IsRestartNumbering &&
           m_NumberingMode == other.m_NumberingMode && m_StartNumberingAt == other.m_StartNumberingAt;
}

void NoteAtt::Save(ByteWriter & out) const
{
    out.Write(static_cast<std::int32_t>(m_Kind));
    out.Write(static_cast<std::int32_t>(m_StartNumberingAt));
    out.Write(static_cast<std::int32_t>(m_NumberingMode));
    out.WriteBool(m_IsRestartNumbering);
}

Kernel::Counted<NoteAtt const> NoteAtt::Load(ByteReader & in)
{
    auto att = Kernel::MakeCounted<NoteAtt>();
    att->m_Kind = in.Read<std::int32_t>();
    att->m_StartNumberingAt = in.Read<std::int32_t>();
    att->m_NumberingMode = in.Read<std::int32_t>();
    att->m_IsRestartNumbering = in.ReadBool();
    return att;
}

void NoteAtt::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    hash.Add(m_Kind);
    hash.Add(m_StartNumberingAt);
    hash.Add(m_NumberingMode);
    hash.Add(m_IsRestartNumbering);
}

}
