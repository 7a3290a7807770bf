#include "framework/story/LayoutBuilder.h"

#include "framework/kernel/Assert.h"
#include "framework/story/Glyph.h"

#include <algorithm>

namespace Story
{

namespace
{

std::uint32_t SizeOf(auto const & elements)
{
    return static_cast<std::uint32_t>(elements.size());
}

bool IsLeftOut(char16_t unit)
{
    return unit == ObjectCharacter || unit == LineSeparator;
}

std::uint16_t FlagsOf(Typeset::PlacedGlyph const & glyph)
{
    std::uint16_t flags = 0;
    if (glyph.m_Flags & Typeset::PlacedGlyph::Space) {
        flags |= LayoutItem::Glyph::Space;
    }
    if (glyph.m_Flags & Typeset::PlacedGlyph::Synthetic) {
        flags |= LayoutItem::Glyph::Synthetic;
    }
    if (glyph.m_Flags & Typeset::PlacedGlyph::Missing) {
        flags |= LayoutItem::Glyph::Missing;
    }
    return flags;
}

}

LayoutBuilder::LayoutBuilder() : m_Layout(Kernel::MakeCounted<Layout>())
{
    static_cast<void>(AddColour(Colour::Grey(0)));
}

void LayoutBuilder::BeginFrame(float width, float height, std::uint32_t textBegin)
{
    LayoutItem::Frame frame;
    frame.m_Width = width;
    frame.m_Height = height;
    frame.m_TextBegin = textBegin;
    frame.m_FirstLine = SizeOf(m_Layout->m_Lines.Own());
    frame.m_FirstBox = SizeOf(m_Layout->m_Boxes.Own());
    frame.m_FirstPicture = SizeOf(m_Layout->m_Pictures.Own());
    frame.m_FirstLink = SizeOf(m_Layout->m_Links.Own());
    Frames().push_back(frame);
}

void LayoutBuilder::EndFrame(std::uint32_t textEnd, float usedHeight)
{
    LayoutItem::Frame & frame = Frames().back();
    frame.m_TextEnd = std::max(textEnd, frame.m_TextBegin);
    frame.m_LineCount = SizeOf(m_Layout->m_Lines.Own()) - frame.m_FirstLine;
    frame.m_BoxCount = SizeOf(m_Layout->m_Boxes.Own()) - frame.m_FirstBox;
    frame.m_PictureCount = SizeOf(m_Layout->m_Pictures.Own()) - frame.m_FirstPicture;
    frame.m_LinkCount = SizeOf(m_Layout->m_Links.Own()) - frame.m_FirstLink;
    frame.m_UsedHeight = usedHeight;
}

void LayoutBuilder::AddRun(Typeset::LineArena const & arena, Typeset::GlyphRun const & run, std::u16string_view text,
                           std::uint32_t clusterBase, float x, float baseline, RunLook const & look)
{
    auto & lines = m_Layout->m_Lines.Own();
    auto & runs = m_Layout->m_Runs.Own();
    auto & glyphs = m_Layout->m_Glyphs.Own();
    auto & offsets = m_Layout->m_Offsets.Own();
    auto & layoutText = m_Layout->m_Text.Own();
    KORVANE_ASSERT(!lines.empty());

    // Marks without width and line ends are no text that a reader would copy.
    bool const isPlain = std::none_of(text.begin(), text.end(), IsLeftOut);
    if (!isPlain) {
        m_PlainText.clear();
        m_PlainOffsets.clear();
        for (char16_t const unit : text) {
            m_PlainOffsets.push_back(SizeOf(m_PlainText));
            if (!IsLeftOut(unit)) {
                m_PlainText.push_back(unit);
            }
        }
        m_PlainOffsets.push_back(SizeOf(m_PlainText));
        text = m_PlainText;
    }

    auto const source = arena.GlyphsOf(run);
    std::uint16_t const font = AddFont(arena.m_Faces[run.m_Face]);
    bool const isRightToLeft = (run.m_Level & 1) != 0;
    bool const hasOffsets = std::any_of(source.begin(), source.end(), [](Typeset::PlacedGlyph const & glyph) {
        return glyph.m_OffsetX != 0 || glyph.m_OffsetY != 0;
    });

    // A glyph keeps its cluster in 13 bits: what shows more text than that is cut into several runs. Clusters ascend
    // or descend, so each piece has a stretch of text of its own.
    constexpr std::uint32_t mostText = LayoutItem::Glyph::ClusterMask;
    bool const isOneToOne = source.size() == text.size();
    auto const clusterOf = [&](Typeset::PlacedGlyph const & glyph) {
        if (clusterBase == LayoutItem::None) {
            return isOneToOne ? static_cast<std::uint32_t>(&glyph - source.data()) : 0U;
        }
        std::uint32_t const length = isPlain ? SizeOf(text) : SizeOf(m_PlainOffsets) - 1;
        std::uint32_t const cluster = std::clamp(glyph.m_Cluster, clusterBase, clusterBase + length) - clusterBase;
        return isPlain ? cluster : m_PlainOffsets[cluster];
    };
    for (std::size_t first = 0; first < source.size();) {
        std::uint32_t low = clusterOf(source[first]);
        std::uint32_t high = low;
        std::size_t end = first;
        float width = 0;
        for (; end < source.size(); ++end) {
            std::uint32_t const cluster = clusterOf(source[end]);
            if (std::max(high, cluster) - std::min(low, cluster) >= mostText) {
                break;
            }
            low = std::min(low, cluster);
            high = std::max(high, cluster);
            width += source[end].m_Advance;
        }
        // The stretch ends where that of the neighbouring piece begins.
        bool const isWhole = first == 0 && end == source.size();
        std::uint32_t textBegin = 0;
        std::uint32_t textEnd = SizeOf(text);
        if (!isWhole && isRightToLeft) {
            textBegin = end == source.size() ? 0 : low;
            textEnd = first == 0 ? SizeOf(text) : clusterOf(source[first - 1]);
        } else if (!isWhole) {
            textBegin = first == 0 ? 0 : low;
            textEnd = end == source.size() ? SizeOf(text) : clusterOf(source[end]);
        }
        textBegin = std::min(textBegin, low);
        textEnd = std::max(textEnd, textBegin);

        LayoutItem::Run target;
        target.m_FirstGlyph = SizeOf(glyphs);
        target.m_GlyphCount = static_cast<std::uint32_t>(end - first);
        target.m_FirstOffset = hasOffsets ? SizeOf(offsets) : LayoutItem::None;
        target.m_TextStart = SizeOf(layoutText);
        target.m_TextLength = textEnd - textBegin;
        target.m_Font = font;
        target.m_Colour = look.m_Colour;
        target.m_Flags = isRightToLeft ? LayoutItem::Run::RightToLeft : 0;
        target.m_Role = static_cast<std::uint16_t>(look.m_Role);
        target.m_Size = run.m_Size;
        target.m_X = x;
        target.m_Baseline = baseline - run.m_Rise;
        target.m_Width = width;
        layoutText.insert(layoutText.end(), text.begin() + textBegin, text.begin() + textEnd);
        for (std::size_t i = first; i < end; ++i) {
            Typeset::PlacedGlyph const & glyph = source[i];
            auto const cluster = std::min(std::max(clusterOf(glyph), textBegin) - textBegin,
                                          std::min(target.m_TextLength, mostText));
            glyphs.push_back(
                {glyph.m_Glyph, static_cast<std::uint16_t>(FlagsOf(glyph) | cluster), glyph.m_Advance});
            if (hasOffsets) {
                offsets.push_back({glyph.m_OffsetX, glyph.m_OffsetY});
            }
        }
        runs.push_back(target);
        ++lines.back().m_RunCount;
        x += width;
        first = end;
    }
}

void LayoutBuilder::AddProblem(LayoutItem::Problem::Kind kind, std::uint32_t storyOffset, String const & text)
{
    m_Layout->m_Problems.Own().push_back({kind, storyOffset, text.Empty() ? LayoutItem::None : AddString(text)});
}

void LayoutBuilder::SetOverset(std::uint32_t storyOffset)
{
    m_Layout->m_IsOverset = true;
    AddProblem(LayoutItem::Problem::Kind::Overset, storyOffset, String());
}

std::uint32_t LayoutBuilder::AddString(String const & text)
{
    auto const [place, isNew] = m_Strings.try_emplace(text, SizeOf(m_Layout->m_Strings));
    if (isNew) {
        m_Layout->m_Strings.push_back(text);
    }
    return place->second;
}

std::uint16_t LayoutBuilder::AddColour(Colour const & colour)
{
    auto & colours = m_Layout->m_Colours;
    auto const place = std::find(colours.begin(), colours.end(), colour);
    auto const index = place - colours.begin();
    if (place == colours.end()) {
        constexpr std::ptrdiff_t mostColours = 0xFFFF;
        if (index >= mostColours) {
            return 0;
        }
        colours.push_back(colour);
    }
    return static_cast<std::uint16_t>(index);
}

std::uint32_t LayoutBuilder::AddHyperlink(Kernel::Counted<HyperlinkData const> const & link)
{
    auto const [place, isNew] = m_Hyperlinks.try_emplace(link.Get(), SizeOf(m_Layout->m_Hyperlinks));
    if (isNew) {
        m_Layout->m_Hyperlinks.push_back(link);
    }
    return place->second;
}

std::uint16_t LayoutBuilder::AddFont(Kernel::Counted<Typeset::FontFace const> const & face)
{
    auto const [place, isNew] = m_Fonts.try_emplace(face.Get(), static_cast<std::uint16_t>(m_Layout->m_Fonts.size()));
    if (isNew) {
        m_Layout->m_Fonts.push_back({face->GetPath(), face->GetIndex(), face->GetHash(), face});
    }
    return place->second;
}

Kernel::Counted<Layout> LayoutBuilder::Finish()
{
    m_Layout->m_HasGlyphData = true;
    return std::move(m_Layout);
}

}
