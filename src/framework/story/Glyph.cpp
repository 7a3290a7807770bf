#include "framework/story/Glyph.h"

#include "framework/story/ByteStream.h"
#include "framework/story/NoteGlyphs.h"
#include "framework/story/PictureGlyph.h"
#include "framework/story/SpecialGlyphs.h"
#include "framework/story/TableGlyph.h"

#include <cmath>

namespace Story
{

namespace
{

using GlyphHandle = Kernel::Counted<Glyph>;

Kernel::Counted<Story const> LoadNestedStory(ByteReader & in)
{
    auto story = Kernel::MakeCounted<Story>();
    if (!story->LoadBytes(in)) {
        in.Fail();
    }
    return story;
}

template <typename TNote>
GlyphHandle LoadNote(ByteReader & in)
{
    auto att = NoteAtt::Load(in);
    return GlyphHandle(Kernel::MakeCounted<TNote>(std::move(att), LoadNestedStory(in)));
}

GlyphHandle LoadAnchor(ByteReader & in)
{
    return Kernel::MakeCounted<AnchorGlyph>(AnchorData::Load(in));
}

GlyphHandle LoadIndexMark(ByteReader & in)
{
    return Kernel::MakeCounted<IndexMarkGlyph>(in.ReadString());
}

GlyphHandle LoadField(ByteReader & in)
{
    auto const kind = in.Read<FieldGlyph::Kind>();
    if (kind > FieldGlyph::Kind::RunningText) {
        in.Fail();
    }
    return Kernel::MakeCounted<FieldGlyph>(kind, in.ReadString());
}

GlyphHandle LoadPicture(ByteReader & in)
{
    PictureGlyph::Fields fields;
    fields.m_DataId = in.ReadString();
    fields.m_Path = in.ReadString();
    fields.m_AltText = in.ReadString();
    for (double * length : {&fields.m_NaturalWidth, &fields.m_NaturalHeight, &fields.m_WantedWidth,
                            &fields.m_WantedMeasurePart}) {
        *length = in.Read<double>();
        if (!std::isfinite(*length) || *length < 0) {
            in.Fail();
        }
    }
    fields.m_IsMissing = in.ReadBool();
    fields.m_MissingReason = in.ReadString();
    return Kernel::MakeCounted<PictureGlyph>(std::move(fields));
}

GlyphHandle LoadTable(ByteReader & in)
{
    TableGlyph::Fields fields;
    fields.m_Rows = in.ReadCount(1);
    fields.m_Columns = in.ReadCount(1);
    fields.m_HeaderRows = in.Read<std::uint32_t>();
    auto const cells = static_cast<std::uint64_t>(fields.m_Rows) * fields.m_Columns;
    if (cells > in.Remaining() || fields.m_HeaderRows > fields.m_Rows) {
        in.Fail();
        return nullptr;
    }
    for (std::uint32_t i = 0; i < fields.m_Columns; ++i) {
        auto const alignment = in.Read<std::uint8_t>();
        if (alignment > ParagraphAtt::Justify) {
            in.Fail();
        }
        fields.m_Alignments.push_back(static_cast<ParagraphAtt::AlignmentKind>(alignment));
    }
    for (std::uint64_t i = 0; i < cells && !in.HasFailed(); ++i) {
        fields.m_Cells.push_back(in.ReadBool() ? LoadNestedStory(in) : Kernel::Counted<Story const>());
    }
    return in.HasFailed() ? GlyphHandle() : GlyphHandle(Kernel::MakeCounted<TableGlyph>(std::move(fields)));
}

struct LoaderEntry
{
    Kernel::ClassUID m_Class;
    GlyphHandle (*m_Load)(ByteReader &);
};

constexpr LoaderEntry Loaders[] = {
    {PinnoteGlyph::c_classUid, LoadNote<PinnoteGlyph>},
    {RangenoteReferenceGlyph::c_classUid, LoadNote<RangenoteReferenceGlyph>},
    {AnchorGlyph::c_classUid, LoadAnchor},
    {IndexMarkGlyph::c_classUid, LoadIndexMark},
    {FieldGlyph::c_classUid, LoadField},
    {PictureGlyph::c_classUid, LoadPicture},
    {TableGlyph::c_classUid, LoadTable},
    {BreakGlyph::c_classUid, [](ByteReader &) { return GlyphHandle(Kernel::MakeCounted<BreakGlyph>()); }},
    {RuleGlyph::c_classUid, [](ByteReader &) { return GlyphHandle(Kernel::MakeCounted<RuleGlyph>()); }},
};

}

Kernel::Counted<Story const> Glyph::GetStory(std::size_t) const
{
    return nullptr;
}

void Glyph::SaveWithClass(ByteWriter & out) const
{
    out.Write(GetClassUID().Value());
    Save(out);
}

Kernel::Counted<Glyph> Glyph::LoadWithClass(ByteReader & in)
{
    Kernel::ClassUID const uid(in.Read<std::uint32_t>());
    for (LoaderEntry const & entry : Loaders) {
        if (entry.m_Class == uid) {
            auto glyph = entry.m_Load(in);
            return in.HasFailed() ? nullptr : glyph;
        }
    }
    in.Fail();
    return nullptr;
}

}
