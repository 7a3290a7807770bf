#include "framework/story/Delta.h"

namespace Story
{

Kernel::Counted<GlyphAtts const> Delta::Apply(Kernel::Counted<GlyphAtts const> const & atts) const
{
    if (m_Fields.m_GlyphAtts.Empty()) {
        return atts;
    }
    AttSet changed = atts ? atts->GetAtts() : AttSet();
    changed.Merge(m_Fields.m_GlyphAtts);
    return Kernel::MakeCounted<GlyphAtts const>(std::move(changed), atts ? atts->GetHyperlink() : nullptr);
}

Kernel::Counted<ParagraphAtts const> Delta::Apply(Kernel::Counted<ParagraphAtts const> const & atts) const
{
    if (!TouchesParagraphs()) {
        return atts;
    }
    AttSet changed = atts ? atts->GetAtts() : AttSet();
    if (m_Fields.m_OnlyIfUnset) {
        AttSet under = m_Fields.m_ParagraphAtts;
        under.Merge(changed);
        changed = std::move(under);
    } else {
        changed.Merge(m_Fields.m_ParagraphAtts);
    }
    Kernel::Counted<ListAtt const> list = atts ? atts->GetSharedListAtt() : nullptr;
    if (m_Fields.m_List && (list || m_Fields.m_AddsList)) {
        auto clone = list ? list->Clone() : Kernel::MakeCounted<ListAtt>();
        clone->CopyFields(*m_Fields.m_List, m_Fields.m_ListFields);
        list = clone;
    }
    return Kernel::MakeCounted<ParagraphAtts const>(std::move(changed), atts ? atts->GetGlyphAtts() : AttSet(),
                                                    std::move(list));
}

ListAttDelta::ListAttDelta(Kernel::Counted<ListAtt const> att, ListAttFields fields, bool addToPlainParagraphs)
    : Delta([&] {
          Fields delta;
          delta.m_List = std::move(att);
          delta.m_ListFields = fields;
          delta.m_AddsList = addToPlainParagraphs;
          return delta;
      }())
{
}

Kernel::Counted<Delta const> MakeDelta(ParagraphAtt::Int att, int value, bool onlyIfUnset)
{
    Delta::Fields fields;
    fields.m_ParagraphAtts.SetInt(att, value);
    fields.m_OnlyIfUnset = onlyIfUnset;
    return Kernel::MakeCounted<Delta const>(std::move(fields));
}

}
