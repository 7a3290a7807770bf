#include "framework/story/NoteGlyphs.h"

#include "framework/story/GlyphCloneContext.h"

namespace Story
{

namespace
{

Kernel::Counted<Story const> CloneNote(Story const & note, GlyphCloneContext & context)
{
    auto copy = Kernel::MakeCounted<Story>();
    copy->AppendText(note.GetAll(), context);
    return copy;
}

}

void NoteReferenceGlyph::Save(ByteWriter & out) const
{
    m_NoteAtt->Save(out);
    m_Note->SaveBytes(out);
}

void NoteReferenceGlyph::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    m_NoteAtt->AccumulateHash(hash);
    m_Note->AccumulateHash(hash);
}

Kernel::Counted<Glyph> PinnoteGlyph::Clone(GlyphCloneContext & context) const
{
    return Kernel::MakeCounted<PinnoteGlyph>(GetNoteAtt(), CloneNote(*GetNote(), context));
}

Kernel::Counted<NoteReferenceGlyph> PinnoteGlyph::WithNoteAtt(Kernel::Counted<NoteAtt const> att) const
{
    return Kernel::MakeCounted<PinnoteGlyph>(std::move(att), GetNote());
}

Kernel::Counted<Glyph> RangenoteReferenceGlyph::Clone(GlyphCloneContext & context) const
{
    return Kernel::MakeCounted<RangenoteReferenceGlyph>(GetNoteAtt(), CloneNote(*GetNote(), context));
}

Kernel::Counted<NoteReferenceGlyph> RangenoteReferenceGlyph::WithNoteAtt(Kernel::Counted<NoteAtt const> att) const
{
    return Kernel::MakeCounted<RangenoteReferenceGlyph>(std::move(att), GetNote());
}

bool IsPinnoteGlyph(Glyph const & glyph)
{
    return glyph.GetClassUID() == PinnoteGlyph::c_classUid;
}

bool IsNoteReferenceGlyph::operator()(Glyph const & glyph) const
{
    return IsPinnoteGlyph(glyph) || glyph.GetClassUID() == RangenoteReferenceGlyph::c_classUid;
}

Kernel::Counted<NoteAtt const> GetNoteAtt(Kernel::Counted<Glyph const> const & glyph)
{
    auto const * note = dynamic_cast<NoteReferenceGlyph const *>(glyph.Get());
    return note ? note->GetNoteAtt() : nullptr;
}

}
