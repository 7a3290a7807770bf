#include "framework/story/GlyphAtts.h"

namespace Story
{

Kernel::Counted<GlyphAtts const> GlyphAtts::FromStyle(String const & style)
{
    AttSet atts;
    atts.SetString(GlyphAtt::Style, style);
    return Kernel::MakeCounted<GlyphAtts const>(std::move(atts));
}

String GlyphAtts::Get(GlyphAtt::String att) const
{
    auto const * text = m_Atts.FindString(att);
    return text ? *text : String();
}

}
