#include "framework/story/ParagraphAtts.h"

namespace Story
{

Kernel::Counted<ParagraphAtts const> ParagraphAtts::FromStyle(String const & style)
{
    return FromStyle(style, nullptr);
}

Kernel::Counted<ParagraphAtts const> ParagraphAtts::FromStyle(String const & style, Kernel::Counted<ListAtt const> list)
{
    AttSet atts;
    atts.SetString(ParagraphAtt::Style, style);
    return Kernel::MakeCounted<ParagraphAtts const>(std::move(atts), AttSet(), std::move(list));
}

String ParagraphAtts::Get(ParagraphAtt::String att) const
{
    auto const * text = m_Atts.FindString(att);
    return text ? *text : String();
}

int ParagraphAtts::Get(ParagraphAtt::Int att, int fallback) const
{
    auto const * number = m_Atts.FindInt(att);
    return number ? *number : fallback;
}

bool ParagraphAtts::IsEqual(ParagraphAtts const & other) const
{
    bool const sameList = m_ListAtt == other.m_ListAtt ||
                          (m_ListAtt && other.m_ListAtt && m_ListAtt->IsEqual(*other.m_ListAtt));
    return sameList && m_Atts == other.m_Atts && m_GlyphAtts == other.m_GlyphAtts;
}

}
