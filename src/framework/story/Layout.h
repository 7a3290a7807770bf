#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"
#include "framework/story/FlatArray.h"
#include "framework/story/HyperlinkData.h"
#include "framework/story/LayoutItems.h"
#include "framework/typeset/FontFace.h"

#include <span>
#include <string_view>

namespace Story
{

class ByteReader;
class ByteWriter;

/// A font that the layout's glyph numbers belong to: the file, the face in it, and the fingerprint of its content.
struct LayoutFont
{
    String m_Path;
    std::uint32_t m_Index = 0;
    Typeset::ContentHash m_Hash;
    /// The face, if it has been had; see `Layout::LoadFonts`.
    Kernel::Counted<Typeset::FontFace const> m_Face;
};

/// A story set in frames: everything that drawing it, linking into it and asking about it needs, without the story.
///
/// In two parts. The *facts* (frames, places of anchors, links, headings, notes, index marks, problems) are small and
/// load without the rest. The *glyph data* (lines, runs, glyphs, boxes, pictures, fonts, colours, text) is stored
/// uncompressed, and a loaded layout looks at its arrays in the block that it was loaded from. Immutable once composed
/// or loaded; then safe on any thread.
class Layout : public virtual Kernel::Countable
{
public:
    // Facts.

    [[nodiscard]] std::span<LayoutItem::Frame const> GetFrames() const { return m_Frames.View(); }
    /// Places of the anchors, in the order of `CollectAnchors`; an anchor in overset text is not placed.
    [[nodiscard]] std::span<LayoutItem::Place const> GetAnchors() const { return m_Anchors.View(); }
    [[nodiscard]] std::span<LayoutItem::Link const> GetLinks() const { return m_Links.View(); }
    [[nodiscard]] std::span<LayoutItem::Link const> GetLinks(LayoutItem::Frame const & frame) const
    {
        return m_Links.Range(frame.m_FirstLink, frame.m_LinkCount);
    }
    /// Target of a link's `m_Hyperlink`.
    [[nodiscard]] Kernel::Counted<HyperlinkData const> const & GetHyperlink(std::uint32_t index) const
    {
        return m_Hyperlinks[index];
    }
    [[nodiscard]] std::span<LayoutItem::Heading const> GetHeadings() const { return m_Headings.View(); }
    [[nodiscard]] std::span<LayoutItem::Note const> GetNotes() const { return m_Notes.View(); }
    [[nodiscard]] std::span<LayoutItem::IndexMark const> GetIndexMarks() const { return m_IndexMarks.View(); }
    [[nodiscard]] std::span<LayoutItem::Problem const> GetProblems() const { return m_Problems.View(); }
    [[nodiscard]] String const & GetString(std::uint32_t index) const { return m_Strings[index]; }
    /// Some text found no frame.
    [[nodiscard]] bool IsOverset() const { return m_IsOverset; }

    // Glyph data.

    [[nodiscard]] bool HasGlyphData() const { return m_HasGlyphData; }
    [[nodiscard]] std::span<LayoutItem::Line const> GetLines(LayoutItem::Frame const & frame) const
    {
        return m_Lines.Range(frame.m_FirstLine, frame.m_LineCount);
    }
    [[nodiscard]] std::span<LayoutItem::Run const> GetRuns(LayoutItem::Line const & line) const
    {
        return m_Runs.Range(line.m_FirstRun, line.m_RunCount);
    }
    [[nodiscard]] std::span<LayoutItem::Glyph const> GetGlyphs(LayoutItem::Run const & run) const
    {
        return m_Glyphs.Range(run.m_FirstGlyph, run.m_GlyphCount);
    }
    /// Parallel to the run's glyphs, or empty.
    [[nodiscard]] std::span<LayoutItem::Offset const> GetOffsets(LayoutItem::Run const & run) const
    {
        return run.m_FirstOffset == LayoutItem::None ? std::span<LayoutItem::Offset const>()
                                                     : m_Offsets.Range(run.m_FirstOffset, run.m_GlyphCount);
    }
    /// UTF-16 of what the run shows. A glyph's cluster counts from its beginning.
    [[nodiscard]] std::u16string_view GetText(LayoutItem::Run const & run) const
    {
        auto const text = m_Text.Range(run.m_TextStart, run.m_TextLength);
        return {text.data(), text.size()};
    }
    [[nodiscard]] std::span<LayoutItem::Box const> GetBoxes(LayoutItem::Frame const & frame) const
    {
        return m_Boxes.Range(frame.m_FirstBox, frame.m_BoxCount);
    }
    [[nodiscard]] std::span<LayoutItem::Picture const> GetPictures(LayoutItem::Frame const & frame) const
    {
        return m_Pictures.Range(frame.m_FirstPicture, frame.m_PictureCount);
    }
    [[nodiscard]] std::vector<LayoutFont> const & GetFonts() const { return m_Fonts; }
    [[nodiscard]] Colour const & GetColour(std::uint16_t index) const { return m_Colours[index]; }

    // Files.

    /// The facts, as one block for `LoadFacts`.
    void SaveFacts(ByteWriter & out) const;
    /// The glyph data, as one block whose arrays are aligned to 8 bytes from its beginning.
    void SaveGlyphData(ByteWriter & out) const;
    /// Null if the block does not hold together.
    [[nodiscard]] static Kernel::Counted<Layout> LoadFacts(ByteReader & in);
    /// Adds the glyph data to loaded facts. The arrays look at `block`, which is kept alive by `owner` and begins at an
    /// address aligned to 8 bytes. False, and nothing is added, if it does not hold together or belongs to other facts.
    [[nodiscard]] bool LoadGlyphData(std::shared_ptr<void const> owner, std::span<std::byte const> block);
    /// Finds the faces of loaded glyph data. False if a font's file is gone or has changed: the layout is then good for
    /// facts only and has to be composed again.
    [[nodiscard]] bool LoadFonts();

private:
    friend class LayoutBuilder;

    [[nodiscard]] bool CheckFacts() const;
    [[nodiscard]] bool CheckGlyphData() const;

    FlatArray<LayoutItem::Frame> m_Frames;
    FlatArray<LayoutItem::Place> m_Anchors;
    FlatArray<LayoutItem::Link> m_Links;
    FlatArray<LayoutItem::Heading> m_Headings;
    FlatArray<LayoutItem::Note> m_Notes;
    FlatArray<LayoutItem::IndexMark> m_IndexMarks;
    FlatArray<LayoutItem::Problem> m_Problems;
    std::vector<Kernel::Counted<HyperlinkData const>> m_Hyperlinks;
    std::vector<String> m_Strings;
    bool m_IsOverset = false;

    bool m_HasGlyphData = false;
    FlatArray<LayoutItem::Line> m_Lines;
    FlatArray<LayoutItem::Run> m_Runs;
    FlatArray<LayoutItem::Glyph> m_Glyphs;
    FlatArray<LayoutItem::Offset> m_Offsets;
    FlatArray<LayoutItem::Box> m_Boxes;
    FlatArray<LayoutItem::Picture> m_Pictures;
    FlatArray<char16_t> m_Text;
    std::vector<LayoutFont> m_Fonts;
    std::vector<Colour> m_Colours;
};

}
