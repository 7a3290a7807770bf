#include "framework/story/SpecialGlyphs.h"

#include "framework/kernel/HashAccumulator.h"
#include "framework/kernel/Uuid.h"
#include "framework/story/ByteStream.h"
#include "framework/story/GlyphCloneContext.h"

namespace Story
{

Kernel::Counted<Glyph> AnchorGlyph::Clone(GlyphCloneContext & context) const
{
    auto const uid = context.WantsNewIdentities() ? Kernel::Uuid().ToString() : m_Data->GetUid();
    return Kernel::MakeCounted<AnchorGlyph>(Kernel::MakeCounted<AnchorData>(
        m_Data->GetName(), m_Data->IsPDFBookmark(), m_Data->IsTOCEntry(), uid, m_Data->GetLevel()));
}

void AnchorGlyph::Save(ByteWriter & out) const
{
    m_Data->Save(out);
}

void AnchorGlyph::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    m_Data->AccumulateHash(hash);
}

Kernel::Counted<Glyph> IndexMarkGlyph::Clone(GlyphCloneContext &) const
{
    return Kernel::MakeCounted<IndexMarkGlyph>(m_Topic);
}

void IndexMarkGlyph::Save(ByteWriter & out) const
{
    out.WriteString(m_Topic);
}

void IndexMarkGlyph::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    hash.Add(m_Topic);
}

Kernel::Counted<Glyph> FieldGlyph::Clone(GlyphCloneContext &) const
{
    return Kernel::MakeCounted<FieldGlyph>(m_Kind, m_Argument);
}

void FieldGlyph::Save(ByteWriter & out) const
{
    out.Write(m_Kind);
    out.WriteString(m_Argument);
}

void FieldGlyph::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    hash.Add(m_Kind);
    hash.Add(m_Argument);
}

Kernel::Counted<Glyph> BreakGlyph::Clone(GlyphCloneContext &) const
{
    return Kernel::MakeCounted<BreakGlyph>();
}

void BreakGlyph::Save(ByteWriter &) const {}

void BreakGlyph::AccumulateHash(Kernel::HashAccumulator &) const {}

Kernel::Counted<Glyph> RuleGlyph::Clone(GlyphCloneContext &) const
{
    return Kernel::MakeCounted<RuleGlyph>();
}

void RuleGlyph::Save(ByteWriter &) const {}

void RuleGlyph::AccumulateHash(Kernel::HashAccumulator &) const {}

}
