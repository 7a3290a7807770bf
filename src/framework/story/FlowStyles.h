#pragma once

#include "framework/story/GlyphAtts.h"
#include "framework/story/LayoutBuilder.h"
#include "framework/story/ParagraphAtts.h"
#include "framework/story/StyleSheet.h"
#include "framework/typeset/TextStyle.h"

#include <deque>
#include <optional>
#include <unordered_map>

/// Attributes made ready for the composer. Internal to it.

namespace Story::Flow
{

/// A paragraph's attributes in full, and what the composer derives from them.
struct ParagraphStyle
{
    GlyphFormat m_Glyph;
    /// With a leading that is never 0.
    ParagraphFormat m_Format;
};

/// A run's attributes in full.
struct RunStyle
{
    static constexpr std::uint32_t None = 0xFFFFFFFF;

    Kernel::Counted<Typeset::TextStyle const> m_Text;
    std::uint16_t m_Colour = 0;
    std::optional<std::uint16_t> m_Background;
    bool m_Underline = false;
    bool m_Strike = false;
    /// Index into the layout's hyperlinks.
    std::uint32_t m_Hyperlink = None;
};

/// Background and border of a paragraph, with the edges that they reach to. Equal ones are one object.
struct Decoration
{
    std::optional<std::uint16_t> m_Background;
    std::uint16_t m_Border = 0;
    int m_Sides = 0;
    float m_BorderWidth = 0;
    float m_Padding = 0;
    float m_Left = 0;
    float m_Right = 0;
    /// Padding above and below the text: a mere line at the side has none.
    [[nodiscard]] float VerticalPadding() const
    {
        int const horizontal = ParagraphAtt::BorderTop | ParagraphAtt::BorderBottom;
        return m_Background || (m_Sides & horizontal) != 0 ? m_Padding : 0.0F;
    }
    friend bool operator==(Decoration const &, Decoration const &) = default;
};

/// What a run is over and above its attributes.
enum class RunPurpose : std::uint8_t
{
    Text,
    NoteReference,
    NoteNumber,
    Marker
};

/// Resolves attributes, each combination once. Everything handed out lives as long as the object.
class FlowStyles
{
public:
    FlowStyles(StyleSheet const & sheet, LayoutBuilder & layout) : m_Sheet(sheet), m_Layout(layout) {}

    /// Sizes and leadings are multiplied by it from now on: for tables that do not fit.
    void SetScale(double scale) { m_Scale = scale; }
    [[nodiscard]] double GetScale() const { return m_Scale; }

    /// `fallback` names the style of paragraphs that name none.
    [[nodiscard]] ParagraphStyle const & GetParagraph(ParagraphAtts const * atts, char const * fallback);
    [[nodiscard]] RunStyle const & GetRun(ParagraphStyle const & paragraph, GlyphAtts const * atts,
                                          RunPurpose purpose);
    /// Null if the paragraph has neither background nor border.
    [[nodiscard]] Decoration const * GetDecoration(ParagraphFormat const & format, float left, float right);

private:
    [[nodiscard]] Kernel::Counted<Typeset::TextStyle const> GetTextStyle(GlyphFormat const & format,
                                                                         bool hyphenates);

    struct Key
    {
        void const * m_First;
        void const * m_Second;
        std::uint32_t m_Third;
        double m_Scale;
        friend bool operator==(Key const &, Key const &) = default;
    };
    struct KeyHash
    {
        std::size_t operator()(Key const & key) const noexcept
        {
            auto const first = reinterpret_cast<std::size_t>(key.m_First);
            auto const second = reinterpret_cast<std::size_t>(key.m_Second);
            return (first * 31 + second) * 31 + key.m_Third;
        }
    };

    StyleSheet const & m_Sheet;
    LayoutBuilder & m_Layout;
    double m_Scale = 1;
    std::deque<ParagraphStyle> m_ParagraphStyles;
    std::deque<RunStyle> m_RunStyles;
    std::deque<Decoration> m_Decorations;
    std::unordered_map<Key, ParagraphStyle const *, KeyHash> m_Paragraphs;
    std::unordered_map<Key, RunStyle const *, KeyHash> m_Runs;
    struct TextStyleEntry
    {
        GlyphFormat m_Format;
        bool m_Hyphenates;
        Kernel::Counted<Typeset::TextStyle const> m_Style;
    };
    std::vector<TextStyleEntry> m_TextStyles;
};

}
