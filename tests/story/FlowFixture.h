#pragma once

#include "framework/kernel/Utf.h"
#include "framework/story/FlowComposer.h"
#include "framework/story/NoteGlyphs.h"
#include "framework/story/PictureGlyph.h"
#include "framework/story/StoryBuilder.h"
#include "framework/story/TableGlyph.h"

#include <string>
#include <vector>

/// Texts whose line breaks are known, for tests of the composer: size 10, leading 12, so that a frame of 12 n points
/// holds n lines.

namespace FlowTest
{

using Kernel::Counted;
using Kernel::MakeCounted;

inline Counted<Story::StyleSheet> MakeStyles()
{
    using namespace Story;
    auto sheet = MakeCounted<StyleSheet>();
    AttSet glyphs;
    glyphs.SetString(GlyphAtt::Families, "EB Garamond");
    glyphs.SetDouble(GlyphAtt::Size, 10);
    AttSet paragraphs;
    paragraphs.SetDouble(ParagraphAtt::Leading, 12);
    paragraphs.SetInt(ParagraphAtt::Alignment, ParagraphAtt::Left);
    sheet->SetDefaults(glyphs, paragraphs);
    auto const add = [&](char const * name, auto const & change) {
        TextStyle style{name, "", {}, {}};
        change(style);
        sheet->SetParagraphStyle(style);
    };
    add("Body", [](TextStyle &) {});
    add("Heading", [](TextStyle & style) {
        style.m_ParagraphAtts.SetInt(ParagraphAtt::KeepWithNext, 1);
        style.m_ParagraphAtts.SetInt(ParagraphAtt::OutlineLevel, 2);
    });
    add("Spaced", [](TextStyle & style) {
        style.m_GlyphAtts.SetDouble(GlyphAtt::Size, 15);
        style.m_ParagraphAtts.SetDouble(ParagraphAtt::Leading, 17);
        style.m_ParagraphAtts.SetDouble(ParagraphAtt::SpaceBefore, 7);
        style.m_ParagraphAtts.SetDouble(ParagraphAtt::SpaceAfter, 3);
        style.m_ParagraphAtts.SetInt(ParagraphAtt::AlignToGrid, 0);
    });
    add("Together", [](TextStyle & style) { style.m_ParagraphAtts.SetInt(ParagraphAtt::KeepTogether, 1); });
    add("New page", [](TextStyle & style) { style.m_ParagraphAtts.SetInt(ParagraphAtt::PageBreakBefore, 1); });
    add("Caption", [](TextStyle & style) { style.m_ParagraphAtts.SetInt(ParagraphAtt::KeepWithPrevious, 1); });
    add("Picture", [](TextStyle & style) { style.m_ParagraphAtts.SetInt(ParagraphAtt::KeepWithNext, 1); });
    add("Code", [](TextStyle & style) {
        style.m_ParagraphAtts.SetInt(ParagraphAtt::MarkWraps, 1);
        style.m_ParagraphAtts.SetColour(ParagraphAtt::Background, Colour::Grey(0.9F));
        style.m_ParagraphAtts.SetDouble(ParagraphAtt::Padding, 4);
    });
    return sheet;
}

/// A paragraph of `lines` lines: "a1", "a2"...
inline void AddLines(Story::StoryBuilder & builder, std::string const & name, int lines, char const * style)
{
    for (int i = 1; i <= lines; ++i) {
        builder.AppendText(name + std::to_string(i), nullptr);
        if (i < lines) {
            builder.AppendLineBreak(nullptr);
        }
    }
    builder.EndParagraph(Story::ParagraphAtts::FromStyle(style));
}

inline void AddObject(Story::StoryBuilder & builder, Counted<Story::Glyph const> glyph, char const * style)
{
    builder.AppendObject(std::move(glyph), nullptr);
    builder.EndParagraph(Story::ParagraphAtts::FromStyle(style));
}

inline Counted<Story::Story> OneParagraph(std::string const & text, char const * style)
{
    Story::StoryBuilder builder;
    builder.AppendText(text, nullptr);
    builder.EndParagraph(Story::ParagraphAtts::FromStyle(style));
    return builder.Finish();
}

inline Counted<Story::Glyph> MakeNote(std::string const & text, int start, bool restart)
{
    auto att = MakeCounted<Story::NoteAtt>();
    att->SetStartNumberingAt(start);
    att->SetIsRestartNumbering(restart);
    return MakeCounted<Story::PinnoteGlyph>(att, OneParagraph(text, "Note text"));
}

inline Counted<Story::Glyph> MakeAnchor(char const * uid)
{
    return MakeCounted<Story::AnchorGlyph>(MakeCounted<Story::AnchorData>(uid, false, false, uid));
}

inline Counted<Story::Glyph> MakePicture(double width, double height)
{
    Story::PictureGlyph::Fields fields;
    fields.m_DataId = "pic";
    fields.m_NaturalWidth = width;
    fields.m_NaturalHeight = height;
    return MakeCounted<Story::PictureGlyph>(fields);
}

/// Cells "r0c0" and so on; `tall` names a row whose first cell has that many lines.
inline Counted<Story::Glyph> MakeTable(std::uint32_t rows, std::uint32_t columns, std::uint32_t header,
                                       std::uint32_t tallRow, int tallLines)
{
    Story::TableGlyph::Fields fields;
    fields.m_Rows = rows;
    fields.m_Columns = columns;
    fields.m_HeaderRows = header;
    for (std::uint32_t r = 0; r < rows; ++r) {
        for (std::uint32_t c = 0; c < columns; ++c) {
            Story::StoryBuilder cell;
            if (r == tallRow && c == 0) {
                AddLines(cell, "t", tallLines, "Body");
            } else {
                cell.AppendText("r" + std::to_string(r) + "c" + std::to_string(c), nullptr);
                cell.EndParagraph(Story::ParagraphAtts::FromStyle("Body"));
            }
            fields.m_Cells.push_back(cell.Finish());
        }
    }
    return MakeCounted<Story::TableGlyph>(fields);
}

inline Story::FrameSource Frames(double width, double height)
{
    return [=](std::uint32_t) { return Story::FrameGeometry{width, height, 0, 0}; };
}

inline Counted<Story::Layout> Compose(Story::Story const & story, Story::FrameSource const & frames,
                                      Story::ComposeOptions const & options)
{
    Story::FlowComposer composer;
    auto const styles = MakeStyles();
    return composer.Compose(story, *styles, frames, options);
}

inline std::string TextOf(Story::Layout const & layout, Story::LayoutItem::Line const & line)
{
    std::u16string text;
    for (auto const & run : layout.GetRuns(line)) {
        text += layout.GetText(run);
    }
    return Kernel::Utf16ToUtf8(text).ToStd();
}

/// Lines of all frames: "a1 a2|b1".
inline std::string Describe(Story::Layout const & layout)
{
    std::string text;
    for (auto const & frame : layout.GetFrames()) {
        text += text.empty() ? "" : "|";
        bool isFirst = true;
        for (auto const & line : layout.GetLines(frame)) {
            text += (isFirst ? "" : " ") + TextOf(layout, line);
            isFirst = false;
        }
    }
    return text;
}

}
