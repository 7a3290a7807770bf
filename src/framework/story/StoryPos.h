#pragma once

#include "framework/story/Glyph.h"
#include "framework/story/ParagraphAtts.h"

#include <vector>

namespace Story
{

class GlyphAtts;
class Story;

/// A place in a story: between two units, from 0 to the story's length. A default one stands nowhere.
///
/// A borrowed value: good as long as the story lives and is not edited. "The glyph" of a place is the unit after it.
class StoryPos
{
public:
    StoryPos() = default;
    StoryPos(Story const & story, std::size_t offset) : m_Story(&story), m_Offset(offset) {}

    [[nodiscard]] bool IsNull() const { return m_Story == nullptr; }
    [[nodiscard]] Kernel::NonCounted<Story const> GetStory() const { return m_Story; }
    [[nodiscard]] std::size_t GetOffset() const { return m_Offset; }

    /// Below, at or above zero as this place comes before, with or after `other` in the same story.
    [[nodiscard]] int Compare(StoryPos const & other) const;
    friend bool operator==(StoryPos const &, StoryPos const &) = default;
    friend bool operator<(StoryPos const & a, StoryPos const & b) { return a.Compare(b) < 0; }

    /// One unit on, at most to the end.
    StoryPos & operator++();
    /// `count` units on or back, kept within the story.
    void MoveBy(long count);

    [[nodiscard]] bool IsEnd() const;
    /// The unit after this place; 0 at the end.
    [[nodiscard]] char16_t GetUnit() const;
    /// The special element after this place, or null.
    [[nodiscard]] Kernel::Counted<Glyph const> GetGlyph() const;
    [[nodiscard]] Kernel::Counted<GlyphAtts const> GetGlyphAtts() const;
    /// Attributes of the paragraph that holds this place; the end of the story belongs to the last one. Null if none
    /// are set.
    [[nodiscard]] Kernel::Counted<ParagraphAtts const> GetParagraphAtts() const;

    [[nodiscard]] bool IsParagraphBegin() const;
    [[nodiscard]] StoryPos GetParagraphBegin() const;
    /// The end of the paragraph that holds this place: before its end unit, or behind it if `pastEndUnit`.
    [[nodiscard]] StoryPos GetParagraphEnd(bool pastEndUnit) const;
    /// The same, but no further than `limit`.
    [[nodiscard]] StoryPos GetParagraphEnd(StoryPos limit, bool pastEndUnit) const;

    /// Appends to `found` the places from here up to `end` whose element passes `predicate(Glyph const &)`. Jumps from
    /// element to element.
    template <typename TPredicate>
    void BaseCollectIf(std::vector<StoryPos> & found, StoryPos end, TPredicate const & predicate) const;

private:
    Story const * m_Story = nullptr;
    std::size_t m_Offset = 0;
};

/// Two places of one story: from the anchor, where a selection was begun, to the caret, where it was left; either may
/// come first.
class Selection
{
public:
    Selection() = default;
    explicit Selection(StoryPos const & place) : m_Anchor(place), m_Caret(place) {}
    Selection(StoryPos const & anchor, StoryPos const & caret) : m_Anchor(anchor), m_Caret(caret) {}

    /// Stands in no story.
    [[nodiscard]] bool IsNull() const { return m_Anchor.IsNull(); }
    [[nodiscard]] StoryPos const & GetAnchor() const { return m_Anchor; }
    [[nodiscard]] StoryPos const & GetCaret() const { return m_Caret; }
    [[nodiscard]] StoryPos GetMaxBegin() const { return m_Caret < m_Anchor ? m_Caret : m_Anchor; }
    [[nodiscard]] StoryPos GetMaxEnd() const { return m_Caret < m_Anchor ? m_Anchor : m_Caret; }

private:
    StoryPos m_Anchor;
    StoryPos m_Caret;
};

/// A stretch of a story in text order.
struct StoryRange
{
    StoryPos m_Begin;
    StoryPos m_End;
};

}
