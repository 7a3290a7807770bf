#include "framework/render/PdfFontObjects.h"

#include <cmath>

namespace Renderer::RenderTree
{

namespace
{

using Handle = QPDFObjectHandle;
using Effort = PdfCompressor::Deflater::Effort;

/// What a job beside this thread makes of a font.
struct FontData
{
    PdfFont::Program m_Program;
    SpillRange m_ProgramData;
    SpillRange m_ToUnicode;
};

/// A Type 0 font with one descendant (ISO 32000-2, 9.7).
Handle MakeFont(PdfObjects & objects, PdfFont const & font, FontData const & data)
{
    Typeset::FontFace const & face = font.GetFace();
    Typeset::FaceMetrics const & metrics = face.GetMetrics();
    auto const scaled = [&](int value) { return objects.Number(std::round(value * 1000.0 / metrics.m_UnitsPerEm)); };
    std::string const name = "/" + (face.MaySubset() ? data.m_Program.m_Tag + "+" : std::string()) +
                             face.GetPostScriptName().ToStd();

    Handle program = objects.SpilledStream(data.m_ProgramData, "/FlateDecode");
    if (data.m_Program.m_IsCff) {
        program.getDict().replaceKey("/Subtype", objects.Name("/CIDFontType0C"));
    } else {
        program.getDict().replaceKey(
            "/Length1", Handle::newInteger(static_cast<long long>(data.m_Program.m_Bytes.size())));
    }

    // Symbolic, as the glyphs are not of one Latin character set; besides fixed pitch and italic.
    int const flags = 4 | (face.IsMonospaced() ? 1 : 0) | (face.IsItalic() ? 64 : 0);
    Handle descriptor = Handle::newDictionary({
        {"/Type", objects.Name("/FontDescriptor")},
        {"/FontName", Handle::newName(name)},
        {"/Flags", Handle::newInteger(flags)},
        {"/FontBBox", Handle::newArray({scaled(metrics.m_BoxLeft), scaled(metrics.m_BoxBottom),
                                        scaled(metrics.m_BoxRight), scaled(metrics.m_BoxTop)})},
        {"/ItalicAngle", objects.Number(metrics.m_ItalicAngle)},
        {"/Ascent", scaled(metrics.m_Ascent)},
        {"/Descent", scaled(-metrics.m_Descent)},
        {"/CapHeight", scaled(metrics.m_CapHeight)},
        // Files do not tell the width of stems; readers want one to imitate a missing font, which this one is not.
        {"/StemV", Handle::newInteger(50 + face.GetWeight() * face.GetWeight() / 4225)},
        {data.m_Program.m_IsCff ? "/FontFile3" : "/FontFile2", program},
    });
    Handle descendant = Handle::newDictionary({
        {"/Type", objects.Name("/Font")},
        {"/Subtype", objects.Name(data.m_Program.m_IsCff ? "/CIDFontType0" : "/CIDFontType2")},
        {"/BaseFont", Handle::newName(name)},
        {"/CIDSystemInfo", Handle::newDictionary({{"/Registry", Handle::newString("Adobe")},
                                                  {"/Ordering", Handle::newString("Identity")},
                                                  {"/Supplement", Handle::newInteger(0)}})},
        {"/FontDescriptor", objects.GetPdf().makeIndirectObject(descriptor)},
        {"/DW", Handle::newInteger(0)},
        {"/W", Handle::parse(font.MakeWidths())},
    });
    if (!data.m_Program.m_IsCff) {
        descendant.replaceKey("/CIDToGIDMap", objects.Name("/Identity"));
    }
    return objects.GetPdf().makeIndirectObject(Handle::newDictionary({
        {"/Type", objects.Name("/Font")},
        {"/Subtype", objects.Name("/Type0")},
        {"/BaseFont", Handle::newName(name)},
        {"/Encoding", objects.Name("/Identity-H")},
        {"/DescendantFonts", Handle::newArray({objects.GetPdf().makeIndirectObject(descendant)})},
        {"/ToUnicode", objects.SpilledStream(data.m_ToUnicode, "/FlateDecode")},
    }));
}

}

std::vector<QPDFObjectHandle> MakeFonts(PdfObjects & objects, std::vector<std::unique_ptr<PdfFont>> const & fonts,
                                        PdfCompressor & compressor)
{
    PdfSpill & spill = objects.GetSpill();
    std::vector<Handle> made;
    std::vector<FontData> data(fonts.size());
    for (std::size_t i = 0; i < fonts.size(); ++i) {
        if (!fonts[i]->IsEmbedded()) {
            continue;
        }
        compressor.Add(0, [&spill, &font = *fonts[i], &result = data[i]](PdfCompressor::Deflater & deflater) {
            result.m_Program = font.MakeProgram();
            std::string_view packed = deflater.Compress(result.m_Program.m_Bytes, Effort::Thorough);
            result.m_ProgramData = spill.Append(packed.data(), packed.size());
            packed = deflater.Compress(font.MakeToUnicode(), Effort::Thorough);
            result.m_ToUnicode = spill.Append(packed.data(), packed.size());
        });
    }
    compressor.Finish();
    for (std::size_t i = 0; i < fonts.size(); ++i) {
        made.push_back(fonts[i]->IsEmbedded() ? MakeFont(objects, *fonts[i], data[i]) : Handle::newNull());
    }
    return made;
}

}
