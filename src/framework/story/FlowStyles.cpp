#include "framework/story/FlowStyles.h"

#include <algorithm>
#include <charconv>

namespace Story::Flow
{

namespace
{

constexpr double UsualLeading = 1.2;
constexpr double LeastLeading = 0.1;

std::vector<Typeset::FontFeature> ParseFeatures(std::string_view list)
{
    constexpr std::size_t tagLength = 4;
    std::vector<Typeset::FontFeature> features;
    while (!list.empty()) {
        auto const comma = std::min(list.find(','), list.size());
        auto item = list.substr(0, comma);
        list.remove_prefix(std::min(comma + 1, list.size()));
        item.remove_prefix(std::min(item.find_first_not_of(" \t\"'"), item.size()));
        Typeset::FontFeature feature;
        if (!item.empty() && (item.front() == '-' || item.front() == '+')) {
            feature.m_Value = item.front() == '-' ? 0 : 1;
            item.remove_prefix(1);
        }
        if (item.size() < tagLength) {
            continue;
        }
        std::copy_n(item.begin(), tagLength, feature.m_Tag);
        if (auto const equals = item.find('='); equals != std::string_view::npos) {
            std::from_chars(item.data() + equals + 1, item.data() + item.size(), feature.m_Value);
        }
        features.push_back(feature);
    }
    return features;
}

}

ParagraphStyle const & FlowStyles::GetParagraph(ParagraphAtts const * atts, char const * fallback)
{
    auto const [place, isNew] = m_Paragraphs.try_emplace(Key{atts, fallback, 0, m_Scale});
    if (!isNew) {
        return *place->second;
    }
    auto const * named = atts ? atts->GetAtts().FindString(ParagraphAtt::Style) : nullptr;
    auto const & resolved = m_Sheet.ResolveParagraphStyle(named ? named->View() : std::string_view(fallback));
    ParagraphStyle & style = m_ParagraphStyles.emplace_back(ParagraphStyle{resolved.m_Glyph, resolved.m_Paragraph});
    if (atts) {
        style.m_Glyph.Apply(atts->GetGlyphAtts());
        style.m_Format.Apply(atts->GetAtts());
    }
    style.m_Glyph.m_Size *= m_Scale;
    style.m_Format.m_Leading *= m_Scale;
    if (style.m_Format.m_Leading == 0) {
        style.m_Format.m_Leading = style.m_Glyph.m_Size * UsualLeading;
    }
    style.m_Format.m_Leading = std::max(style.m_Format.m_Leading, style.m_Glyph.m_Size * LeastLeading);
    place->second = &style;
    return style;
}

RunStyle const & FlowStyles::GetRun(ParagraphStyle const & paragraph, GlyphAtts const * atts, RunPurpose purpose)
{
    auto const [place, isNew] =
        m_Runs.try_emplace(Key{&paragraph, atts, static_cast<std::uint32_t>(purpose), m_Scale});
    if (!isNew) {
        return *place->second;
    }
    GlyphFormat format = paragraph.m_Glyph;
    if (atts && purpose != RunPurpose::Marker) {
        format.Apply(m_Sheet.ResolveCharacterStyle(atts->Get(GlyphAtt::Style)));
        format.Apply(atts->GetAtts());
    }
    if (purpose == RunPurpose::NoteReference) {
        if (m_Sheet.FindCharacterStyle(StyleSheet::NoteReferenceStyle)) {
            format.Apply(m_Sheet.ResolveCharacterStyle(StyleSheet::NoteReferenceStyle));
        } else {
            format.m_Position = GlyphAtt::Superscript;
        }
    } else if (purpose == RunPurpose::NoteNumber) {
        format.Apply(m_Sheet.ResolveCharacterStyle(StyleSheet::NoteNumberStyle));
    }
    RunStyle & style = m_RunStyles.emplace_back();
    style.m_Text = GetTextStyle(format, paragraph.m_Format.m_Hyphenate);
    style.m_Colour = m_Layout.AddColour(format.m_Colour);
    if (format.m_Background) {
        style.m_Background = m_Layout.AddColour(*format.m_Background);
    }
    style.m_Underline = format.m_Underline;
    style.m_Strike = format.m_Strike;
    bool const isLink = atts && atts->GetHyperlink() && purpose == RunPurpose::Text;
    if (isLink) {
        style.m_Hyperlink = m_Layout.AddHyperlink(atts->GetHyperlink());
    }
    place->second = &style;
    return style;
}

Kernel::Counted<Typeset::TextStyle const> FlowStyles::GetTextStyle(GlyphFormat const & format, bool hyphenates)
{
    // Colours and lines do not change shapes: what differs only in them shares one style of the shaper.
    GlyphFormat shape = format;
    shape.m_Colour = {};
    shape.m_Background.reset();
    shape.m_Underline = false;
    shape.m_Strike = false;
    auto const known = std::find_if(m_TextStyles.begin(), m_TextStyles.end(), [&](TextStyleEntry const & entry) {
        return entry.m_Hyphenates == hyphenates && entry.m_Format == shape;
    });
    if (known != m_TextStyles.end()) {
        return known->m_Style;
    }
    auto style = Kernel::MakeCounted<Typeset::TextStyle>();
    style->m_Families = format.m_Families;
    style->m_Language = format.m_Language;
    style->m_Size = format.m_Size;
    style->m_Weight = format.m_Weight;
    style->m_Tracking = format.m_Tracking;
    style->m_Features = ParseFeatures(format.m_Features);
    style->m_Capitals = format.m_SmallCaps ? Typeset::Capitals::SmallCaps : Typeset::Capitals::AsTyped;
    style->m_Position = format.m_Position == GlyphAtt::Superscript ? Typeset::ScriptPosition::Superscript
                        : format.m_Position == GlyphAtt::Subscript ? Typeset::ScriptPosition::Subscript
                                                                   : Typeset::ScriptPosition::Normal;
    style->m_Italic = format.m_Italic;
    style->m_Ligatures = format.m_Ligatures;
    style->m_Hyphenate = format.m_Hyphenate && hyphenates;
    m_TextStyles.push_back({std::move(shape), hyphenates, style});
    return style;
}

Decoration const * FlowStyles::GetDecoration(ParagraphFormat const & format, float left, float right)
{
    bool const hasBorder = format.m_BorderSides != 0 && format.m_BorderWidth > 0;
    if (!format.m_Background && !hasBorder) {
        return nullptr;
    }
    Decoration decoration;
    if (format.m_Background) {
        decoration.m_Background = m_Layout.AddColour(*format.m_Background);
    }
    if (hasBorder) {
        decoration.m_Border = m_Layout.AddColour(format.m_Border);
        decoration.m_Sides = format.m_BorderSides;
        decoration.m_BorderWidth = static_cast<float>(format.m_BorderWidth);
    }
    decoration.m_Padding = static_cast<float>(format.m_Padding);
    decoration.m_Left = left;
    decoration.m_Right = right;
    auto const known = std::find(m_Decorations.begin(), m_Decorations.end(), decoration);
    return known != m_Decorations.end() ? &*known : &m_Decorations.emplace_back(decoration);
}

}
