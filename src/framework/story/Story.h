#pragma once

#include "framework/kernel/Serialisable.h"
#include "framework/story/Glyph.h"
#include "framework/story/GlyphAtts.h"
#include "framework/story/GlyphString.h"
#include "framework/story/ParagraphAtts.h"
#include "framework/story/StoryPos.h"

#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace Story
{

class Delta;

/// A text: UTF-16 units, with attributes of characters in runs, attributes of paragraphs, and special elements.
///
/// A paragraph ends in U+000A; the last one may lack it. A special element is one U+FFFC unit with a `Glyph` attached
/// at its offset, and each U+FFFC has one. Offsets count units from 0. Attribute objects and elements are immutable
/// and shared with clones, so a clone costs little more than its units.
///
/// A story belongs to its document (or note, cell...) and follows that domain's lock: any number of readers, or one
/// writer. Nothing in it is computed lazily, so readers need no further lock.
///
/// Written as one array of bytes with tables of the distinct attributes in front. Reading checks every index and
/// length, and a story that does not hold together is refused as a whole.
class Story : public virtual Kernel::Serialisable
{
public:
    struct GlyphRun
    {
        std::uint32_t m_End = 0;
        Kernel::Counted<GlyphAtts const> m_Atts;
    };
    struct Paragraph
    {
        /// Behind the end unit, if there is one.
        std::uint32_t m_End = 0;
        Kernel::Counted<ParagraphAtts const> m_Atts;
    };
    struct Object
    {
        std::uint32_t m_Offset = 0;
        Kernel::Counted<Glyph const> m_Glyph;
    };

    Story() = default;

    // Looking.

    [[nodiscard]] bool Empty() const { return m_Text.empty(); }
    [[nodiscard]] std::size_t GetLength() const { return m_Text.size(); }
    [[nodiscard]] std::u16string_view GetText() const { return m_Text; }
    /// Runs in text order, together covering the text; neighbours differ.
    [[nodiscard]] std::span<GlyphRun const> GetGlyphRuns() const { return m_Runs; }
    /// Paragraphs in text order, together covering the text. An empty story has none.
    [[nodiscard]] std::span<Paragraph const> GetParagraphs() const { return m_Paragraphs; }
    /// Special elements in text order.
    [[nodiscard]] std::span<Object const> GetObjects() const { return m_Objects; }

    [[nodiscard]] StoryPos gbegin() const { return {*this, 0}; }
    /// The end of the text; with `beforeLastEnd`, before the last paragraph's end unit, if it has one.
    [[nodiscard]] StoryPos gend(bool beforeLastEnd) const;
    [[nodiscard]] StoryRange GetAll() const { return {gbegin(), gend(false)}; }

    /// Index of the paragraph that holds `offset`; the end of the text belongs to the last. Asserts that there is one.
    [[nodiscard]] std::size_t GetParagraphIndex(std::size_t offset) const;
    [[nodiscard]] std::size_t GetParagraphBegin(std::size_t index) const
    {
        return index == 0 ? 0 : m_Paragraphs[index - 1].m_End;
    }
    /// Index of the run that holds the unit at `offset`, which is below the length.
    [[nodiscard]] std::size_t GetRunIndex(std::size_t offset) const;
    /// Element of the unit at `offset`, or null.
    [[nodiscard]] Kernel::Counted<Glyph const> GetGlyph(std::size_t offset) const;
    /// Index of the first element at or after `offset`.
    [[nodiscard]] std::size_t GetObjectIndex(std::size_t offset) const;
    /// UTF-8 of a stretch, elements left out.
    [[nodiscard]] String GetString(std::size_t begin, std::size_t end) const;

    // Changing. Offsets out of range are programming mistakes and asserted.

    /// Appends a stretch of another story, attributes and elements with it; elements are copied through `context`.
    void AppendText(StoryRange const & range, GlyphCloneContext & context);
    /// Appends characters with these attributes, which may be null. Paragraphs that end in them, and what stands
    /// behind, take `paragraphAtts`.
    void AppendText(GlyphString const & text, Kernel::Counted<GlyphAtts const> const & glyphAtts,
                    Kernel::Counted<ParagraphAtts const> const & paragraphAtts);
    /// Puts `text` in place of the units from `begin` to `end`. A paragraph that loses its end joins the next one and
    /// keeps the attributes of whichever has the end unit.
    void ReplaceText(std::size_t begin, std::size_t end, Story const & text, GlyphCloneContext & context);
    /// Another element in place of the one at `offset`.
    void ReplaceGlyph(std::size_t offset, Kernel::Counted<Glyph const> glyph);
    /// Lays `delta` over everything.
    void FormatText(Kernel::Counted<Delta const> const & delta);
    /// Lays `delta` over the characters from `begin` to `end` and over the paragraphs that they touch; an empty stretch
    /// touches the paragraph that it stands in.
    void FormatText(Kernel::Counted<Delta const> const & delta, std::size_t begin, std::size_t end);

    /// A story of its own with the same content; identities are kept.
    [[nodiscard]] Kernel::Counted<Story> Clone() const;
    /// Exchanges the whole content, as undo does.
    void SwapContent(Story & other);

    // Serialisable.

    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;
    /// Everything that the layout depends on: text, attributes, elements.
    void AccumulateHash(Kernel::HashAccumulator & hash) const override;
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;

    /// The bytes of a story inside of an element; see docs/file-format.md.
    void SaveBytes(ByteWriter & out) const;
    [[nodiscard]] bool LoadBytes(ByteReader & in);

private:
    friend class StoryBuilder;

    /// Paragraphs and elements agree with the units of the text.
    [[nodiscard]] bool HoldsTogether() const;
    /// Without a context the elements themselves are taken over.
    void AppendRange(Story const & source, std::size_t begin, std::size_t end, GlyphCloneContext * context);

    std::u16string m_Text;
    std::vector<GlyphRun> m_Runs;
    std::vector<Paragraph> m_Paragraphs;
    std::vector<Object> m_Objects;
};

template <typename TPredicate>
void StoryPos::BaseCollectIf(std::vector<StoryPos> & found, StoryPos end, TPredicate const & predicate) const
{
    if (IsNull()) {
        return;
    }
    auto const objects = m_Story->GetObjects();
    for (std::size_t i = m_Story->GetObjectIndex(m_Offset); i < objects.size(); ++i) {
        if (objects[i].m_Offset >= end.GetOffset()) {
            break;
        }
        if (predicate(*objects[i].m_Glyph)) {
            found.emplace_back(*m_Story, objects[i].m_Offset);
        }
    }
}

}
