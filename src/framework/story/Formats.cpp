#include "framework/story/Formats.h"

#include <algorithm>
#include <cmath>

namespace Story
{

namespace
{

// Text larger or smaller than this is a fault in a template or a file; the composer counts on sane lengths.
constexpr double SmallestSize = 0.5;
constexpr double LargestSize = 2000;
constexpr double LargestLength = 20000;

double Length(double value)
{
    return std::isfinite(value) ? std::clamp(value, -LargestLength, LargestLength) : 0.0;
}

double PositiveLength(double value)
{
    return std::max(0.0, Length(value));
}

std::vector<String> SplitFamilies(std::string_view list)
{
    std::vector<String> families;
    while (!list.empty()) {
        auto const comma = std::min(list.find(','), list.size());
        auto name = list.substr(0, comma);
        list.remove_prefix(std::min(comma + 1, list.size()));
        auto const first = name.find_first_not_of(" \t\"'");
        if (first != std::string_view::npos) {
            families.emplace_back(name.substr(first, name.find_last_not_of(" \t\"'") - first + 1));
        }
    }
    return families;
}

void ApplyGlyphInt(GlyphFormat & format, int id, int value)
{
    switch (id) {
    case GlyphAtt::Weight:
        format.m_Weight = std::clamp(value, 1, 1000);
        break;
    case GlyphAtt::Italic:
        format.m_Italic = value != 0;
        break;
    case GlyphAtt::Underline:
        format.m_Underline = value != 0;
        break;
    case GlyphAtt::Strike:
        format.m_Strike = value != 0;
        break;
    case GlyphAtt::Position:
        if (value >= GlyphAtt::OnBaseline && value <= GlyphAtt::Subscript) {
            format.m_Position = static_cast<GlyphAtt::VerticalPosition>(value);
        }
        break;
    case GlyphAtt::Hyphenate:
        format.m_Hyphenate = value != 0;
        break;
    case GlyphAtt::Ligatures:
        format.m_Ligatures = value != 0;
        break;
    case GlyphAtt::SmallCaps:
        format.m_SmallCaps = value != 0;
        break;
    default:
        break;
    }
}

void ApplyGlyphDouble(GlyphFormat & format, int id, double value)
{
    switch (id) {
    case GlyphAtt::Size:
        format.m_Size = std::clamp(PositiveLength(value), SmallestSize, LargestSize);
        break;
    case GlyphAtt::Tracking:
        format.m_Tracking = Length(value);
        break;
    case GlyphAtt::SizeFactor:
        format.m_Size = std::clamp(format.m_Size * PositiveLength(value), SmallestSize, LargestSize);
        break;
    default:
        break;
    }
}

void ApplyGlyphString(GlyphFormat & format, int id, String const & value)
{
    switch (id) {
    case GlyphAtt::Families:
        if (auto families = SplitFamilies(value); !families.empty()) {
            format.m_Families = std::move(families);
        }
        break;
    case GlyphAtt::Language:
        format.m_Language = value;
        break;
    case GlyphAtt::Features:
        format.m_Features = value;
        break;
    default:
        break;
    }
}

void ApplyParagraphInt(ParagraphFormat & format, int id, int value)
{
    constexpr int mostLines = 100;
    switch (id) {
    case ParagraphAtt::Alignment:
        if (value >= ParagraphAtt::Left && value <= ParagraphAtt::Justify) {
            format.m_Alignment = static_cast<ParagraphAtt::AlignmentKind>(value);
        }
        break;
    case ParagraphAtt::KeepWithNext:
        format.m_KeepWithNext = value != 0;
        break;
    case ParagraphAtt::KeepTogether:
        format.m_KeepTogether = value != 0;
        break;
    case ParagraphAtt::Orphans:
        format.m_Orphans = std::clamp(value, 1, mostLines);
        break;
    case ParagraphAtt::Widows:
        format.m_Widows = std::clamp(value, 1, mostLines);
        break;
    case ParagraphAtt::Hyphenate:
        format.m_Hyphenate = value != 0;
        break;
    case ParagraphAtt::AlignToGrid:
        format.m_AlignToGrid = value != 0;
        break;
    case ParagraphAtt::PageBreakBefore:
        format.m_PageBreakBefore = value != 0;
        break;
    case ParagraphAtt::OutlineLevel:
        format.m_OutlineLevel = std::clamp(value, 0, 6);
        break;
    case ParagraphAtt::TabSize:
        format.m_TabSize = std::clamp(value, 1, 64);
        break;
    case ParagraphAtt::MarkWraps:
        format.m_MarkWraps = value != 0;
        break;
    case ParagraphAtt::BorderSides:
        format.m_BorderSides = value;
        break;
    case ParagraphAtt::KeepWithPrevious:
        format.m_KeepWithPrevious = value != 0;
        break;
    case ParagraphAtt::CollatedEndnotes:
        format.m_CollatedEndnotes = value != 0;
        break;
    default:
        break;
    }
}

void ApplyParagraphDouble(ParagraphFormat & format, int id, double value)
{
    switch (id) {
    case ParagraphAtt::LeftIndent:
        format.m_LeftIndent = Length(value);
        break;
    case ParagraphAtt::RightIndent:
        format.m_RightIndent = Length(value);
        break;
    case ParagraphAtt::FirstLineIndent:
        format.m_FirstLineIndent = Length(value);
        break;
    case ParagraphAtt::SpaceBefore:
        format.m_SpaceBefore = PositiveLength(value);
        break;
    case ParagraphAtt::SpaceAfter:
        format.m_SpaceAfter = PositiveLength(value);
        break;
    case ParagraphAtt::Leading:
        format.m_Leading = PositiveLength(value);
        break;
    case ParagraphAtt::Padding:
        format.m_Padding = PositiveLength(value);
        break;
    case ParagraphAtt::BorderWidth:
        format.m_BorderWidth = PositiveLength(value);
        break;
    case ParagraphAtt::ListIndent:
        format.m_ListIndent = PositiveLength(value);
        break;
    default:
        break;
    }
}

constexpr int IdMask = 0x3FFF;

}

void GlyphFormat::Apply(AttSet const & atts)
{
    for (AttSet::Entry const & entry : atts.Entries()) {
        int const id = entry.m_Key & IdMask;
        if (auto const * number = std::get_if<std::int32_t>(&entry.m_Value)) {
            ApplyGlyphInt(*this, id, *number);
        } else if (auto const * real = std::get_if<double>(&entry.m_Value)) {
            ApplyGlyphDouble(*this, id, *real);
        } else if (auto const * text = std::get_if<String>(&entry.m_Value)) {
            ApplyGlyphString(*this, id, *text);
        } else if (id == GlyphAtt::Text) {
            m_Colour = std::get<Colour>(entry.m_Value);
        } else if (id == GlyphAtt::Background) {
            m_Background = std::get<Colour>(entry.m_Value);
        }
    }
}

void ParagraphFormat::Apply(AttSet const & atts)
{
    for (AttSet::Entry const & entry : atts.Entries()) {
        int const id = entry.m_Key & IdMask;
        if (auto const * number = std::get_if<std::int32_t>(&entry.m_Value)) {
            ApplyParagraphInt(*this, id, *number);
        } else if (auto const * real = std::get_if<double>(&entry.m_Value)) {
            ApplyParagraphDouble(*this, id, *real);
        } else if (auto const * colour = std::get_if<Colour>(&entry.m_Value)) {
            if (id == ParagraphAtt::Background) {
                m_Background = *colour;
            } else if (id == ParagraphAtt::Border) {
                m_Border = *colour;
            }
        }
    }
}

}
