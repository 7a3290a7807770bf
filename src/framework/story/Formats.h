#pragma once

#include "framework/story/Attributes.h"
#include "framework/story/AttSet.h"

#include <optional>
#include <vector>

namespace Story
{

/// Character attributes as they are after styles and overrides are laid over each other: what the composer reads.
struct GlyphFormat
{
    std::vector<String> m_Families{String("EB Garamond")};
    String m_Language{"en"};
    String m_Features;
    double m_Size = 10.5;
    double m_Tracking = 0;
    int m_Weight = 400;
    GlyphAtt::VerticalPosition m_Position = GlyphAtt::OnBaseline;
    bool m_Italic = false;
    bool m_Underline = false;
    bool m_Strike = false;
    bool m_Hyphenate = true;
    bool m_Ligatures = true;
    bool m_SmallCaps = false;
    Colour m_Colour;
    std::optional<Colour> m_Background;

    /// Lays `atts` over this. A size factor multiplies the size that stands here.
    void Apply(AttSet const & atts);
    friend bool operator==(GlyphFormat const &, GlyphFormat const &) = default;
};

/// Paragraph attributes likewise.
struct ParagraphFormat
{
    ParagraphAtt::AlignmentKind m_Alignment = ParagraphAtt::Justify;
    double m_LeftIndent = 0;
    double m_RightIndent = 0;
    double m_FirstLineIndent = 0;
    double m_SpaceBefore = 0;
    double m_SpaceAfter = 0;
    double m_Leading = 0;
    double m_Padding = 0;
    double m_BorderWidth = 0;
    double m_ListIndent = 14;
    int m_Orphans = 2;
    int m_Widows = 2;
    int m_OutlineLevel = 0;
    int m_TabSize = 4;
    int m_BorderSides = 0;
    bool m_KeepWithNext = false;
    bool m_KeepWithPrevious = false;
    bool m_KeepTogether = false;
    bool m_Hyphenate = true;
    bool m_AlignToGrid = true;
    bool m_PageBreakBefore = false;
    bool m_MarkWraps = false;
    bool m_CollatedEndnotes = false;
    std::optional<Colour> m_Background;
    Colour m_Border;

    void Apply(AttSet const & atts);
    friend bool operator==(ParagraphFormat const &, ParagraphFormat const &) = default;
};

}
