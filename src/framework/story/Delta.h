#pragma once

#include "framework/story/GlyphAtts.h"
#include "framework/story/ParagraphAtts.h"

namespace Story
{

/// A change of attributes, to be laid over a stretch of text: it sets what it names and leaves the rest. Immutable.
class Delta : public virtual Kernel::Countable
{
public:
    struct Fields
    {
        AttSet m_GlyphAtts;
        AttSet m_ParagraphAtts;
        /// Paragraph attributes are set only where the paragraph itself does not set them.
        bool m_OnlyIfUnset = false;
        /// Gives the fields that `m_ListFields` names to the list attribute of paragraphs that are list items; with
        /// `m_AddsList` other paragraphs become items. Null leaves lists alone.
        Kernel::Counted<ListAtt const> m_List;
        ListAttFields m_ListFields{};
        bool m_AddsList = false;
    };

    explicit Delta(Fields fields) : m_Fields(std::move(fields)) {}

    [[nodiscard]] bool TouchesGlyphs() const { return !m_Fields.m_GlyphAtts.Empty(); }
    [[nodiscard]] bool TouchesParagraphs() const { return !m_Fields.m_ParagraphAtts.Empty() || m_Fields.m_List; }
    [[nodiscard]] Kernel::Counted<GlyphAtts const> Apply(Kernel::Counted<GlyphAtts const> const & atts) const;
    [[nodiscard]] Kernel::Counted<ParagraphAtts const> Apply(Kernel::Counted<ParagraphAtts const> const & atts) const;

private:
    Fields m_Fields;
};

/// Sets the named fields of the list attribute and nothing else.
class ListAttDelta : public Delta
{
public:
    /// With `addToPlainParagraphs`, paragraphs that are no list items become such; otherwise they are left alone.
    ListAttDelta(Kernel::Counted<ListAtt const> att, ListAttFields fields, bool addToPlainParagraphs);
};

/// Sets one paragraph attribute; with `onlyIfUnset`, only where the paragraph does not set it.
[[nodiscard]] Kernel::Counted<Delta const> MakeDelta(ParagraphAtt::Int att, int value, bool onlyIfUnset);

}
