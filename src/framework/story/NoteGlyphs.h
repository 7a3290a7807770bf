#pragma once

#include "framework/story/Glyph.h"
#include "framework/story/NoteAtt.h"
#include "framework/story/Story.h"

namespace Story
{

/// Reference of a note in the text, with the note's own text. Shows as the note's number, raised.
class NoteReferenceGlyph : public Glyph
{
public:
    NoteReferenceGlyph(Kernel::Counted<NoteAtt const> att, Kernel::Counted<Story const> note)
        : m_NoteAtt(std::move(att)), m_Note(std::move(note))
    {
    }

    [[nodiscard]] Kernel::Counted<NoteAtt const> const & GetNoteAtt() const { return m_NoteAtt; }
    /// The note's text; never null, and it ends in a paragraph end.
    [[nodiscard]] Kernel::Counted<Story const> const & GetNote() const { return m_Note; }
    /// The same reference and text with another attribute.
    [[nodiscard]] virtual Kernel::Counted<NoteReferenceGlyph> WithNoteAtt(Kernel::Counted<NoteAtt const> att) const = 0;

    [[nodiscard]] std::size_t GetStoryCount() const override { return 1; }
    [[nodiscard]] Kernel::Counted<Story const> GetStory(std::size_t) const override { return m_Note; }
    void Save(ByteWriter & out) const override;
    void AccumulateHash(Kernel::HashAccumulator & hash) const override;

private:
    Kernel::Counted<NoteAtt const> m_NoteAtt;
    Kernel::Counted<Story const> m_Note;
};

/// A note that belongs to one point of the text: the ordinary footnote, endnote or sidenote.
class PinnoteGlyph : public NoteReferenceGlyph
{
public:
    static constexpr Kernel::ClassUID c_classUid{"GlPn"};
    using NoteReferenceGlyph::NoteReferenceGlyph;
    [[nodiscard]] Kernel::ClassUID GetClassUID() const override { return c_classUid; }
    [[nodiscard]] Kernel::Counted<Glyph> Clone(GlyphCloneContext & context) const override;
    [[nodiscard]] Kernel::Counted<NoteReferenceGlyph> WithNoteAtt(Kernel::Counted<NoteAtt const> att) const override;
};

/// A note that belongs to a stretch of text; its reference stands at the end of the stretch.
class RangenoteReferenceGlyph : public NoteReferenceGlyph
{
public:
    static constexpr Kernel::ClassUID c_classUid{"GlRn"};
    using NoteReferenceGlyph::NoteReferenceGlyph;
    [[nodiscard]] Kernel::ClassUID GetClassUID() const override { return c_classUid; }
    [[nodiscard]] Kernel::Counted<Glyph> Clone(GlyphCloneContext & context) const override;
    [[nodiscard]] Kernel::Counted<NoteReferenceGlyph> WithNoteAtt(Kernel::Counted<NoteAtt const> att) const override;
};

[[nodiscard]] bool IsPinnoteGlyph(Glyph const & glyph);

/// Glyph test: passes references of notes of every kind.
struct IsNoteReferenceGlyph
{
    [[nodiscard]] bool operator()(Glyph const & glyph) const;
};

/// The attribute of a note reference; null for any other element and for null.
[[nodiscard]] Kernel::Counted<NoteAtt const> GetNoteAtt(Kernel::Counted<Glyph const> const & glyph);

}
