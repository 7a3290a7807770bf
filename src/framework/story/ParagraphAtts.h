#pragma once

#include "framework/kernel/Counted.h"
#include "framework/story/Attributes.h"
#include "framework/story/AttSet.h"
#include "framework/story/ListAtt.h"

namespace Story
{

/// Attributes of a paragraph: a paragraph style, what is set over it, character attributes for all of its text, and
/// the list that it is an item of. Immutable and shared, on any thread. Null stands for "none set".
class ParagraphAtts : public virtual Kernel::Countable
{
public:
    ParagraphAtts() = default;
    ParagraphAtts(AttSet atts, AttSet glyphAtts, Kernel::Counted<ListAtt const> list)
        : m_Atts(std::move(atts)), m_GlyphAtts(std::move(glyphAtts)), m_ListAtt(std::move(list))
    {
    }

    /// Only the style, by name.
    [[nodiscard]] static Kernel::Counted<ParagraphAtts const> FromStyle(String const & style);
    /// The style as an item of a list.
    [[nodiscard]] static Kernel::Counted<ParagraphAtts const> FromStyle(String const & style,
                                                                       Kernel::Counted<ListAtt const> list);

    [[nodiscard]] AttSet const & GetAtts() const { return m_Atts; }
    [[nodiscard]] AttSet const & GetGlyphAtts() const { return m_GlyphAtts; }
    /// With 0 the paragraph style's name; empty if it is not set.
    [[nodiscard]] String Get(ParagraphAtt::String att) const;
    /// The value set on the paragraph itself, or `fallback`.
    [[nodiscard]] int Get(ParagraphAtt::Int att, int fallback) const;
    /// Null outside of lists.
    [[nodiscard]] Kernel::NonCounted<ListAtt const> GetListAtt() const { return m_ListAtt; }
    [[nodiscard]] Kernel::Counted<ListAtt const> const & GetSharedListAtt() const { return m_ListAtt; }

    [[nodiscard]] bool IsEqual(ParagraphAtts const & other) const;

private:
    AttSet m_Atts;
    AttSet m_GlyphAtts;
    Kernel::Counted<ListAtt const> m_ListAtt;
};

}
