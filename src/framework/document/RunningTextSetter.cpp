#include "framework/document/RunningTextSetter.h"

#include "framework/kernel/Utf.h"

#include <algorithm>
#include <vector>

Raster::Colour ToRasterColour(Story::Colour const & colour)
{
    auto const & c = colour.m_Components;
    switch (colour.m_Space) {
    case Story::Colour::Space::Grey:
        return Raster::Colour::Grey(c[0]);
    case Story::Colour::Space::RGB:
        return Raster::Colour::Rgb(c[0], c[1], c[2]);
    case Story::Colour::Space::CMYK:
        return Raster::Colour::Cmyk(c[0], c[1], c[2], c[3]);
    case Story::Colour::Space::Lab:
        return Raster::Colour::Lab(c[0] * 100, c[1] * 255 - 128, c[2] * 255 - 128);
    }
    return Raster::Colour::Black();
}

void RunningTextSetter::SetStyleSheet(Kernel::Counted<Story::StyleSheet const> const & styles)
{
    if (m_Styles != styles) {
        m_Styles = styles;
        m_TextStyles.clear();
    }
}

RunningTextSetter::Style const & RunningTextSetter::GetStyle(String const & name)
{
    auto const known = m_TextStyles.find(name);
    if (known != m_TextStyles.end()) {
        return known->second;
    }
    KORVANE_ASSERT(m_Styles);
    Story::GlyphFormat const & format = m_Styles->ResolveParagraphStyle(name).m_Glyph;
    Kernel::Counted<Typeset::TextStyle> const style = Kernel::MakeCounted<Typeset::TextStyle>();
    style->m_Families = format.m_Families;
    style->m_Language = format.m_Language;
    style->m_Size = format.m_Size;
    style->m_Weight = format.m_Weight;
    style->m_Tracking = format.m_Tracking;
    style->m_Italic = format.m_Italic;
    style->m_Ligatures = format.m_Ligatures;
    style->m_Capitals = format.m_SmallCaps ? Typeset::Capitals::SmallCaps : Typeset::Capitals::AsTyped;
    style->m_Hyphenate = false;
    return m_TextStyles.emplace(name, Style{style, ToRasterColour(format.m_Colour)}).first->second;
}

double RunningTextSetter::Set(std::u16string const & text, Style const & style)
{
    // Wide enough that nothing breaks, whatever the text.
    Typeset::ParagraphSettings settings;
    settings.m_Width = 1e6;
    settings.m_Alignment = Typeset::Alignment::Left;
    settings.m_LastLineAlignment = Typeset::Alignment::Left;
    settings.m_Mode = Typeset::BreakMode::Greedy;
    settings.m_Hyphenate = false;
    Typeset::ParagraphInput input;
    input.m_Text = text;
    input.m_Styles = {&style.m_Style, 1};
    input.m_Settings = &settings;
    m_Arena.Clear();
    m_Builder.Build(input, m_Arena);
    return m_Arena.m_Lines.empty() ? 0 : m_Arena.m_Lines.front().m_SetWidth;
}

double RunningTextSetter::SetWithin(double room, std::u16string & text, Style const & style)
{
    // No line holds more than this, in whatever letters: what is behind need not be measured anew on each page.
    constexpr double mostPerEm = 16;
    auto const most = static_cast<std::size_t>(mostPerEm * std::max(room / style.m_Style->m_Size, 4.0));
    bool const isTooLong = most < text.size();
    text.resize(std::min(most, text.size()));
    if (double const width = isTooLong ? 0 : Set(text, style); !isTooLong && width <= room) {
        return width;
    }
    std::vector<std::size_t> ends;
    for (std::size_t at = text.find(u' ', 1); at < text.size(); at = text.find(u' ', at + 1)) {
        ends.push_back(at);
    }
    auto const fits = [&](std::size_t end) { return Set(text.substr(0, end) + u'\u2026', style) <= room; };
    auto const tooLong = std::partition_point(ends.begin(), ends.end(), fits);
    if (ends.begin() != tooLong) {
        text.resize(*std::prev(tooLong));
    } else {
        // A word that is too long by itself is halved until it fits.
        text.resize(ends.empty() ? text.size() / 2 : ends.front());
        while (!text.empty() && !fits(text.size())) {
            text.resize(text.size() / 2);
        }
    }
    return Set(text + u'\u2026', style);
}

void RunningTextSetter::Draw(RunningTextNode const & node, Fields const & fields, Kernel::PointT<double> offset,
                             Renderer::RenderTree::DisplayList & list)
{
    std::string joined;
    bool hasField = false;
    bool hasContent = false;
    for (RunningTextPart const & part : node.GetParts()) {
        String const & text = RunningTextField::PageNumber == part.m_Field         ? fields.m_PageNumber
                              : RunningTextField::PublicationTitle == part.m_Field ? fields.m_PublicationTitle
                              : RunningTextField::DocumentTitle == part.m_Field    ? fields.m_DocumentTitle
                                                                                   : part.m_Text;
        bool const isField = RunningTextField::Text != part.m_Field;
        hasField |= isField;
        hasContent |= isField && !text.Empty();
        joined += text.View();
    }
    if (joined.empty() || (hasField && !hasContent)) {
        return;
    }
    Style const & style = GetStyle(node.GetStyle());
    Kernel::Rect const rect = node.GetSpreadBaseBox(false);
    std::u16string text = Kernel::Utf8ToUtf16(joined);
    std::replace(text.begin(), text.end(), u'\n', u' ');
    double const width = SetWithin(rect.Width(), text, style);
    if (m_Arena.m_Lines.empty()) {
        return;
    }
    std::u16string const shown = text.size() < m_Arena.m_Lines.front().m_TextEnd ? text + u'\u2026' : text;
    double x = rect.left + offset.x;
    if (RunningTextAlignment::Centre == node.GetAlignment()) {
        x += (rect.Width() - width) / 2;
    } else if (RunningTextAlignment::Right == node.GetAlignment()) {
        x += rect.Width() - width;
    }
    double const baseline = rect.bottom + offset.y;
    Typeset::Line const & line = m_Arena.m_Lines.front();
    for (Typeset::GlyphRun const & run : m_Arena.RunsOf(line)) {
        Renderer::RenderTree::GlyphRun drawn;
        drawn.m_Face = m_Arena.m_Faces[run.m_Face];
        drawn.m_Size = run.m_Size;
        drawn.m_Colour = style.m_Colour;
        drawn.m_Origin = {x + line.m_X + run.m_X, baseline - run.m_Rise};
        drawn.m_Level = run.m_Level;
        list.DrawGlyphs(drawn, m_Arena.GlyphsOf(run),
                        std::u16string_view(shown).substr(run.m_TextStart, run.m_TextEnd - run.m_TextStart),
                        run.m_TextStart);
    }
}
