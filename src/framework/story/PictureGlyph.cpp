#include "framework/story/PictureGlyph.h"

#include "framework/kernel/HashAccumulator.h"
#include "framework/story/ByteStream.h"

namespace Story
{

Kernel::Counted<Glyph> PictureGlyph::Clone(GlyphCloneContext &) const
{
    return Kernel::MakeCounted<PictureGlyph>(m_Fields);
}

void PictureGlyph::Save(ByteWriter & out) const
{
    out.WriteString(m_Fields.m_DataId);
    out.WriteString(m_Fields.m_Path);
    out.WriteString(m_Fields.m_AltText);
    out.Write(m_Fields.m_NaturalWidth);
    out.Write(m_Fields.m_NaturalHeight);
    out.Write(m_Fields.m_WantedWidth);
    out.Write(m_Fields.m_WantedMeasurePart);
    out.WriteBool(m_Fields.m_IsMissing);
    out.WriteString(m_Fields.m_MissingReason);
}

void PictureGlyph::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    hash.Add(m_Fields.m_DataId);
    hash.Add(m_Fields.m_Path);
    hash.Add(m_Fields.m_AltText);
    hash.Add(m_Fields.m_NaturalWidth);
    hash.Add(m_Fields.m_NaturalHeight);
    hash.Add(m_Fields.m_WantedWidth);
    hash.Add(m_Fields.m_WantedMeasurePart);
    hash.Add(m_Fields.m_IsMissing);
    hash.Add(m_Fields.m_MissingReason);
}

}
