#include "framework/story/Layout.h"

#include "framework/story/ByteStream.h"
#include "framework/typeset/FontLibrary.h"

namespace Story
{

namespace
{

constexpr std::uint32_t FactsVersion = 1;
constexpr std::uint32_t GlyphDataVersion = 1;

using LayoutItem::None;

bool IsRange(std::uint64_t first, std::uint64_t count, std::size_t size)
{
    return first + count <= size;
}

bool IsPlaceIn(LayoutItem::Place const & place, std::size_t frames)
{
    return !place.IsPlaced() || place.m_Frame < frames;
}

bool IsIndexOrNone(std::uint32_t index, std::size_t size)
{
    return index == None || index < size;
}

template <typename T>
void ReadCopy(ByteReader & in, FlatArray<T> & array)
{
    std::vector<T> values;
    in.ReadArrayInto(values);
    array = FlatArray<T>(std::move(values));
}

template <typename T>
void ReadView(ByteReader & in, std::shared_ptr<void const> const & owner, FlatArray<T> & array)
{
    array = FlatArray<T>(owner, in.ReadArray<T>());
}

}

void Layout::SaveFacts(ByteWriter & out) const
{
    out.Write(FactsVersion);
    out.WriteBool(m_IsOverset);
    out.WriteArray(m_Frames.View());
    out.WriteArray(m_Anchors.View());
    out.WriteArray(m_Links.View());
    out.WriteArray(m_Headings.View());
    out.WriteArray(m_Notes.View());
    out.WriteArray(m_IndexMarks.View());
    out.WriteArray(m_Problems.View());
    out.Write(static_cast<std::uint32_t>(m_Hyperlinks.size()));
    for (auto const & link : m_Hyperlinks) {
        link->Save(out);
    }
    out.Write(static_cast<std::uint32_t>(m_Strings.size()));
    for (String const & text : m_Strings) {
        out.WriteString(text);
    }
}

Kernel::Counted<Layout> Layout::LoadFacts(ByteReader & in)
{
    constexpr std::size_t leastLink = 31;
    constexpr std::size_t leastString = 4;
    auto layout = Kernel::MakeCounted<Layout>();
    if (in.Read<std::uint32_t>() != FactsVersion) {
        in.Fail();
    }
    layout->m_IsOverset = in.ReadBool();
    ReadCopy(in, layout->m_Frames);
    ReadCopy(in, layout->m_Anchors);
    ReadCopy(in, layout->m_Links);
    ReadCopy(in, layout->m_Headings);
    ReadCopy(in, layout->m_Notes);
    ReadCopy(in, layout->m_IndexMarks);
    ReadCopy(in, layout->m_Problems);
    for (auto count = in.ReadCount(leastLink); count > 0 && !in.HasFailed(); --count) {
        layout->m_Hyperlinks.push_back(HyperlinkData::Load(in));
    }
    for (auto count = in.ReadCount(leastString); count > 0 && !in.HasFailed(); --count) {
        layout->m_Strings.push_back(in.ReadString());
    }
    if (in.HasFailed() || !layout->CheckFacts()) {
        in.Fail();
        return nullptr;
    }
    return layout;
}

bool Layout::CheckFacts() const
{
    std::size_t const frames = m_Frames.Size();
    for (auto const & frame : m_Frames) {
        if (!IsRange(frame.m_FirstLink, frame.m_LinkCount, m_Links.Size())) {
            return false;
        }
    }
    for (auto const & place : m_Anchors) {
        if (!IsPlaceIn(place, frames)) {
            return false;
        }
    }
    for (auto const & link : m_Links) {
        if (!IsIndexOrNone(link.m_Hyperlink, m_Hyperlinks.size()) || !IsIndexOrNone(link.m_Note, m_Notes.Size())) {
            return false;
        }
    }
    for (auto const & heading : m_Headings) {
        if (!IsPlaceIn(heading.m_Place, frames) || heading.m_Text >= m_Strings.size()) {
            return false;
        }
    }
    for (auto const & note : m_Notes) {
        if (!IsPlaceIn(note.m_Reference, frames) || !IsPlaceIn(note.m_Text, frames)) {
            return false;
        }
    }
    for (auto const & mark : m_IndexMarks) {
        if (!IsPlaceIn(mark.m_Place, frames) || mark.m_Topic >= m_Strings.size()) {
            return false;
        }
    }
    for (auto const & problem : m_Problems) {
        if (!IsIndexOrNone(problem.m_Text, m_Strings.size())) {
            return false;
        }
    }
    return true;
}

void Layout::SaveGlyphData(ByteWriter & out) const
{
    out.Reserve(m_Glyphs.View().size_bytes() + m_Runs.View().size_bytes() + m_Lines.View().size_bytes() +
                m_Text.View().size_bytes() + 4096);
    out.Write(GlyphDataVersion);
    out.WriteArray(m_Lines.View());
    out.WriteArray(m_Runs.View());
    out.WriteArray(m_Glyphs.View());
    out.WriteArray(m_Offsets.View());
    out.WriteArray(m_Boxes.View());
    out.WriteArray(m_Pictures.View());
    out.WriteArray(m_Text.View());
    out.Write(static_cast<std::uint32_t>(m_Fonts.size()));
    for (LayoutFont const & font : m_Fonts) {
        out.WriteString(font.m_Path);
        out.Write(font.m_Index);
        out.Write(font.m_Hash.m_High);
        out.Write(font.m_Hash.m_Low);
    }
    out.Write(static_cast<std::uint32_t>(m_Colours.size()));
    for (Colour const & colour : m_Colours) {
        out.Write(colour.m_Space);
        out.WriteBytes(colour.m_Components.data(), sizeof(colour.m_Components));
    }
}

bool Layout::LoadGlyphData(std::shared_ptr<void const> owner, std::span<std::byte const> block)
{
    constexpr std::size_t leastFont = 24;
    ByteReader in(block);
    if (in.Read<std::uint32_t>() != GlyphDataVersion) {
        in.Fail();
    }
    ReadView(in, owner, m_Lines);
    ReadView(in, owner, m_Runs);
    ReadView(in, owner, m_Glyphs);
    ReadView(in, owner, m_Offsets);
    ReadView(in, owner, m_Boxes);
    ReadView(in, owner, m_Pictures);
    ReadView(in, owner, m_Text);
    m_Fonts.clear();
    for (auto count = in.ReadCount(leastFont); count > 0 && !in.HasFailed(); --count) {
        LayoutFont font;
        font.m_Path = in.ReadString();
        font.m_Index = in.Read<std::uint32_t>();
        font.m_Hash.m_High = in.Read<std::uint64_t>();
        font.m_Hash.m_Low = in.Read<std::uint64_t>();
        m_Fonts.push_back(std::move(font));
    }
    m_Colours.clear();
    for (auto count = in.ReadCount(sizeof(Colour::m_Components)); count > 0 && !in.HasFailed(); --count) {
        Colour & colour = m_Colours.emplace_back();
        colour.m_Space = in.Read<Colour::Space>();
        for (float & component : colour.m_Components) {
            component = in.Read<float>();
        }
    }
    m_HasGlyphData = !in.HasFailed() && CheckGlyphData();
    if (!m_HasGlyphData) {
        m_Lines = {};
        m_Runs = {};
        m_Glyphs = {};
        m_Offsets = {};
        m_Boxes = {};
        m_Pictures = {};
        m_Text = {};
        m_Fonts.clear();
        m_Colours.clear();
    }
    return m_HasGlyphData;
}

bool Layout::CheckGlyphData() const
{
    for (auto const & frame : m_Frames) {
        if (!IsRange(frame.m_FirstLine, frame.m_LineCount, m_Lines.Size()) ||
            !IsRange(frame.m_FirstBox, frame.m_BoxCount, m_Boxes.Size()) ||
            !IsRange(frame.m_FirstPicture, frame.m_PictureCount, m_Pictures.Size())) {
            return false;
        }
    }
    for (auto const & line : m_Lines) {
        if (!IsRange(line.m_FirstRun, line.m_RunCount, m_Runs.Size())) {
            return false;
        }
    }
    for (auto const & run : m_Runs) {
        bool const offsetsFit =
            run.m_FirstOffset == None || IsRange(run.m_FirstOffset, run.m_GlyphCount, m_Offsets.Size());
        if (!IsRange(run.m_FirstGlyph, run.m_GlyphCount, m_Glyphs.Size()) || !offsetsFit ||
            !IsRange(run.m_TextStart, run.m_TextLength, m_Text.Size()) || run.m_Font >= m_Fonts.size() ||
            run.m_Colour >= m_Colours.size()) {
            return false;
        }
        for (auto const & glyph : m_Glyphs.Range(run.m_FirstGlyph, run.m_GlyphCount)) {
            if ((glyph.m_Text & LayoutItem::Glyph::ClusterMask) > run.m_TextLength) {
                return false;
            }
        }
    }
    for (auto const & box : m_Boxes) {
        if (box.m_Colour >= m_Colours.size() || box.m_Kind > LayoutItem::Box::Kind::MissingPicture) {
            return false;
        }
    }
    for (auto const & picture : m_Pictures) {
        if (picture.m_DataId >= m_Strings.size() || picture.m_AltText >= m_Strings.size()) {
            return false;
        }
    }
    for (Colour const & colour : m_Colours) {
        if (colour.m_Space > Colour::Space::Lab) {
            return false;
        }
    }
    return true;
}

bool Layout::LoadFonts()
{
    auto & library = Typeset::FontLibrary::GetInstance();
    for (LayoutFont & font : m_Fonts) {
        if (!font.m_Face) {
            font.m_Face = library.FromFileAndHash(font.m_Path, font.m_Index, font.m_Hash);
        }
        if (!font.m_Face) {
            return false;
        }
    }
    return true;
}

}
