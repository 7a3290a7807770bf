#include "PageWriter.h"

#include "framework/typeset/FontLibrary.h"

#include <hb.h>

using namespace Renderer;
using namespace Renderer::RenderTree;

PdfExport & PageWriter::GetExport()
{
    if (!m_Export) {
        Kernel::Counted<FileExportOptionsPDF> options = Kernel::MakeCounted<FileExportOptionsPDF>();
        options->SetSettings(m_Settings);
        Kernel::Counted<PdfSchema> schema = Kernel::MakeCounted<PdfSchema>(options, nullptr);
        schema->SetColourFormatAndProfiles(m_Format, {});
        m_Export = std::make_unique<PdfExport>(schema, nullptr);
        m_Stream = Kernel::MakeCounted<Kernel::MemoryOutStream>();
        EXPECT_TRUE(m_Export->Create("out.pdf", m_Stream, "A subject", m_Title, "An author", "one, two"));
    }
    return *m_Export;
}

void PageWriter::Write(DisplayList const & list)
{
    PdfPage page;
    page.m_Boxes = PageBoxes::Plain(Page);
    Write(list, page, {});
}

void PageWriter::Write(DisplayList const & list, PdfPage const & page, std::vector<PdfHyperlink> const & links)
{
    EXPECT_TRUE(GetExport().WritePage(page, list, links, &m_Warnings)) << GetExport().GetError();
}

std::string PageWriter::Finish()
{
    EXPECT_TRUE(GetExport().Close()) << GetExport().GetError();
    auto const & bytes = m_Stream->GetBytes();
    return std::string(reinterpret_cast<char const *>(bytes.data()), bytes.size());
}

PdfProbe & PageWriter::Probe()
{
    if (!m_Probe) {
        m_Probe = std::make_unique<PdfProbe>(m_Folder.WriteFile("out.pdf", Finish()));
        EXPECT_EQ(m_Probe->Check(), "");
    }
    return *m_Probe;
}

Kernel::Counted<Typeset::FontFace const> FaceAt(char const * path)
{
    Kernel::Counted<Typeset::FontFace const> face = Typeset::FontLibrary::GetInstance().FromFile(path, 0);
    EXPECT_TRUE(face) << path;
    return face;
}

Kernel::Counted<Typeset::FontFace const> Garamond()
{
    return FaceAt("/usr/share/fonts/opentype/ebgaramond/EBGaramond12-Regular.otf");
}

Kernel::Counted<Typeset::FontFace const> Liberation()
{
    return FaceAt("/usr/share/fonts/truetype/liberation2/LiberationSerif-Regular.ttf");
}

void DrawText(DisplayList & list, Kernel::Counted<Typeset::FontFace const> const & face, double size,
              Kernel::Point const & origin, std::u16string_view text, int level)
{
    hb_buffer_t * const buffer = hb_buffer_create();
    hb_buffer_add_utf16(buffer, reinterpret_cast<std::uint16_t const *>(text.data()), static_cast<int>(text.size()), 0,
                        static_cast<int>(text.size()));
    hb_buffer_guess_segment_properties(buffer);
    hb_buffer_set_direction(buffer, level % 2 ? HB_DIRECTION_RTL : HB_DIRECTION_LTR);
    hb_shape(face->GetHbFont(), buffer, nullptr, 0);
    unsigned count = 0;
    hb_glyph_info_t const * const infos = hb_buffer_get_glyph_infos(buffer, &count);
    hb_glyph_position_t const * const positions = hb_buffer_get_glyph_positions(buffer, nullptr);
    float const scale = static_cast<float>(size / face->GetUnitsPerEm());
    std::vector<Typeset::PlacedGlyph> glyphs(count);
    for (unsigned i = 0; i < count; ++i) {
        glyphs[i].m_Glyph = static_cast<std::uint16_t>(infos[i].codepoint);
        glyphs[i].m_Cluster = infos[i].cluster;
        glyphs[i].m_Advance = static_cast<float>(positions[i].x_advance) * scale;
        glyphs[i].m_OffsetX = static_cast<float>(positions[i].x_offset) * scale;
        glyphs[i].m_OffsetY = static_cast<float>(-positions[i].y_offset) * scale;
    }
    hb_buffer_destroy(buffer);
    GlyphRun run;
    run.m_Face = face;
    run.m_Size = size;
    run.m_Origin = origin;
    run.m_Level = level;
    list.DrawGlyphs(run, glyphs, text, 0);
}
