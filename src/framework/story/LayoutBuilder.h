#pragma once

#include "framework/story/Layout.h"
#include "framework/typeset/LineArena.h"

#include <string>
#include <unordered_map>

namespace Story
{

/// Fills a layout, frame by frame. Internal to the composer. One thread.
class LayoutBuilder
{
public:
    /// Looks of a run of glyphs.
    struct RunLook
    {
        std::uint16_t m_Colour = 0;
        LayoutItem::Role m_Role = LayoutItem::Role::Text;
    };

    LayoutBuilder();

    void BeginFrame(float width, float height, std::uint32_t textBegin);
    /// Ends the frame that is open; box and link ranges are those of what was added meanwhile.
    void EndFrame(std::uint32_t textEnd, float usedHeight);
    [[nodiscard]] std::uint32_t GetFrameIndex() const { return static_cast<std::uint32_t>(Frames().size() - 1); }
    [[nodiscard]] std::uint32_t GetFrameCount() const { return static_cast<std::uint32_t>(Frames().size()); }

    [[nodiscard]] std::uint32_t GetRunCount() const
    {
        return static_cast<std::uint32_t>(m_Layout->m_Runs.Own().size());
    }
    void BeginLine(LayoutItem::Line const & line) { m_Layout->m_Lines.Own().push_back(line); }
    /// Appends glyphs of a composed run to the line that is open. `text` is what the run shows, and the clusters of
    /// its glyphs count in the same text from `clusterBase`. With None for it, glyphs stand for one unit each in turn,
    /// or all for the whole text if the numbers differ.
    void AddRun(Typeset::LineArena const & arena, Typeset::GlyphRun const & run, std::u16string_view text,
                std::uint32_t clusterBase, float x, float baseline, RunLook const & look);
    void AddBox(LayoutItem::Box const & box) { m_Layout->m_Boxes.Own().push_back(box); }
    void AddPicture(LayoutItem::Picture const & picture) { m_Layout->m_Pictures.Own().push_back(picture); }
    void AddLink(LayoutItem::Link const & link) { m_Layout->m_Links.Own().push_back(link); }
    void AddHeading(LayoutItem::Heading const & heading) { m_Layout->m_Headings.Own().push_back(heading); }
    void AddIndexMark(LayoutItem::IndexMark const & mark) { m_Layout->m_IndexMarks.Own().push_back(mark); }
    void AddProblem(LayoutItem::Problem::Kind kind, std::uint32_t storyOffset, String const & text);
    void SetOverset(std::uint32_t storyOffset);

    /// Places that are known in number before any is set.
    [[nodiscard]] std::vector<LayoutItem::Place> & Anchors() { return m_Layout->m_Anchors.Own(); }
    [[nodiscard]] std::vector<LayoutItem::Note> & Notes() { return m_Layout->m_Notes.Own(); }

    [[nodiscard]] std::uint32_t AddString(String const & text);
    [[nodiscard]] std::uint16_t AddColour(Colour const & colour);
    [[nodiscard]] std::uint32_t AddHyperlink(Kernel::Counted<HyperlinkData const> const & link);

    [[nodiscard]] Kernel::Counted<Layout> Finish();

private:
    [[nodiscard]] std::vector<LayoutItem::Frame> & Frames() { return m_Layout->m_Frames.Own(); }
    [[nodiscard]] std::vector<LayoutItem::Frame> const & Frames() const
    {
        return m_Layout->m_Frames.Own();
    }
    [[nodiscard]] std::uint16_t AddFont(Kernel::Counted<Typeset::FontFace const> const & face);

    Kernel::Counted<Layout> m_Layout;
    std::unordered_map<Typeset::FontFace const *, std::uint16_t> m_Fonts;
    std::unordered_map<HyperlinkData const *, std::uint32_t> m_Hyperlinks;
    std::unordered_map<String, std::uint32_t> m_Strings;
    // The text of the run that is added, without what is left out, and where each unit of the whole went.
    std::u16string m_PlainText;
    std::vector<std::uint32_t> m_PlainOffsets;
};

}
