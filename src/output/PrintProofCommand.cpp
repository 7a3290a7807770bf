#include "output/PrintProofCommand.h"

#include "framework/kernel/FileOutStream.h"
#include "framework/kernel/LocalisedString.h"
#include "framework/raster/PngEncoder.h"
#include "framework/render/RasterSink.h"
#include "framework/typeset/FontLibrary.h"

#include <algorithm>
#include <cmath>

namespace Book
{

namespace
{

namespace RenderTree = Renderer::RenderTree;
using Transform = Raster::AffineTransform::Params;

/// In pixels.
constexpr double Margin = 28;
constexpr double Caption = 26;
constexpr double CaptionSize = 15;
constexpr double LargestPageSide = 2000;
constexpr double WidestProof = 1800;

constexpr float ContentOpacity = 0.5F;
constexpr Raster::Colour Ground = Raster::Colour::Grey(0.86F);
constexpr Raster::Colour PaperEdge = Raster::Colour::Grey(0.55F);
constexpr Raster::Colour Words = Raster::Colour::Grey(0.25F);
constexpr Raster::Colour Trim = Raster::Colour::Rgb(0.1F, 0.35F, 0.75F);
constexpr Raster::Colour Number = Raster::Colour::Rgb(0.1F, 0.35F, 0.75F, 0.6F);
constexpr Raster::Colour Bleed = Raster::Colour::Rgb(0.98F, 0.8F, 0.8F);

/// The longest side of a sheet: the fewer there are, the larger.
double SideOfSheet(std::size_t sheets)
{
    return sheets <= 2 ? 840 : sheets <= 6 ? 560 : 400;
}

std::vector<PaginatorPage> FirstOf(std::vector<PaginatorPage> sheets)
{
    sheets.resize(std::min(sheets.size(), PrintProofCommand::MostSheets));
    return sheets;
}

Renderer::Stroke Line(double width)
{
    return {width, {}, {}, 10, {}, 0};
}

}

KORVANE_DEFINE_BOOK_COMMAND(PrintProofCommand, "PrPf");

PrintProofCommand::PrintProofCommand(std::vector<PaginatorPage> sheets, PrintSettings const & settings, String target)
    : PrintCommand(FirstOf(std::move(sheets)), settings), m_Target(std::move(target))
{
}

ExportResult PrintProofCommand::Begin(std::map<int, PrintedPage> const &)
{
    Kernel::Counted<BookChapter const> const key = GetBookController()->GetKeyChapter(true);
    if (!key || GetSheets().empty()) {
        SetError(Kernel::LocalisedString("There is no sheet to show.", "Output"));
        return ExportResultFailed;
    }
    m_Schema = Kernel::MakeCounted<RenderTree::Schema>();
    m_Schema->SetColourFormatAndProfiles(Raster::Format::Rgba8, key->GetProfiles());
    m_Face = Typeset::FontLibrary::GetInstance().Find("sans-serif", 400, false).m_Face;

    Kernel::Size paper;
    for (PaginatorPage const & sheet : GetSheets()) {
        PrintSheet const placed(sheet, GetSettings());
        paper.width = std::max(paper.width, placed.GetPaper().width);
        paper.height = std::max(paper.height, placed.GetPaper().height);
        for (PrintSheet::Piece const & piece : placed.GetPieces()) {
            double & scale = m_PageScales[piece.m_Index];
            scale = std::max(scale, std::abs(piece.m_ToPaper.a));
        }
    }
    double const longest = std::max(paper.width, paper.height);
    if (!(longest > 0) || !std::isfinite(longest)) {
        SetError(Kernel::LocalisedString("The sheets have no size that could be shown.", "Output"));
        return ExportResultFailed;
    }
    m_Scale = SideOfSheet(GetSheets().size()) / longest;
    for (auto & [index, scale] : m_PageScales) {
        scale *= m_Scale;
    }
    m_Cell = {std::ceil(paper.width * m_Scale) + Margin, std::ceil(paper.height * m_Scale) + Margin + Caption};
    int const count = static_cast<int>(GetSheets().size());
    // A front and its back stand side by side.
    m_Columns = std::clamp(static_cast<int>(WidestProof / m_Cell.width), 1, count);
    m_Columns -= m_Columns > 2 && m_Columns < count ? m_Columns % 2 : 0;
    m_Rows = (count + m_Columns - 1) / m_Columns;
    m_Proof.FillRect({0, 0, m_Columns * m_Cell.width + Margin, m_Rows * m_Cell.height + Margin}, Ground);
    return ExportResultOk;
}

bool PrintProofCommand::TakePage(int index, PrintedPage const & page, RenderTree::DisplayList const & content)
{
    Kernel::Rect const & bounds = page.m_Bounds;
    double const limit = LargestPageSide / std::max(bounds.Width(), bounds.Height());
    double const scale = std::min(m_PageScales[index], limit);
    int const width = std::max(1, static_cast<int>(std::lround(bounds.Width() * scale)));
    int const height = std::max(1, static_cast<int>(std::lround(bounds.Height() * scale)));
    auto const toPixels = Transform::Translation(-bounds.left, -bounds.top)
                              .Then(Transform::Scale(width / bounds.Width(), height / bounds.Height()));
    m_Pictures[index] = {bounds, RenderTree::RasterSink(m_Schema).Draw(content, width, height, toPixels, nullptr)};
    return true;
}

bool PrintProofCommand::MakeSheet(PaginatorPage const & sheet)
{
    PrintSheet const placed(sheet, GetSettings());
    double const x = Margin + m_Done % m_Columns * m_Cell.width;
    double const y = Margin + m_Done / m_Columns * m_Cell.height;
    ++m_Done;
    Kernel::Rect const paper{0, 0, placed.GetPaper().width, placed.GetPaper().height};
    RenderTree::Group group;
    group.m_Transform = Transform::Scale(m_Scale, m_Scale).Then(Transform::Translation(x, y));
    group.m_Clip = Renderer::Path::Rectangle(group.m_Transform.MapBounds(paper));
    Kernel::Rect const edge = group.m_Transform.MapBounds(paper);
    m_Proof.FillRect(edge, Raster::Colour::White());
    m_Proof.BeginGroup(std::move(group));
    for (PrintSheet::Piece const & piece : placed.GetPieces()) {
        DrawPiece(piece);
    }
    placed.DrawMarks(m_Proof, 1 / m_Scale);
    m_Proof.EndGroup();
    m_Proof.StrokePath(Renderer::Path::Rectangle(edge), PaperEdge, Line(1));
    DrawWords("Side " + std::to_string(m_Done), CaptionSize, {(edge.left + edge.right) / 2, edge.bottom + Caption / 2},
              Words);
    return true;
}

void PrintProofCommand::DrawPiece(PrintSheet::Piece const & piece)
{
    Kernel::Rect const & trim = piece.m_Trim;
    if (trim.IsEmpty() || !(trim.Width() > 0) || !(trim.Height() > 0)) {
        return;
    }
    if (piece.m_Shown != trim) {
        m_Proof.FillRect(piece.m_Shown, Bleed);
        m_Proof.FillRect(trim, Raster::Colour::White());
    }
    auto const picture = m_Pictures.find(piece.m_Index);
    if (picture != m_Pictures.end() && picture->second.m_Bitmap) {
        Kernel::Rect const & bounds = picture->second.m_Bounds;
        RenderTree::Group content;
        content.m_Clip = Renderer::Path::Rectangle(piece.m_Shown);
        content.m_Opacity = static_cast<double>(ContentOpacity);
        m_Proof.BeginGroup(std::move(content));
        m_Proof.DrawBitmap(picture->second.m_Bitmap,
                           Raster::ICCManager::GetInstance().GetDefaultProfileForFormat(Raster::Format::Rgba8),
                           Transform::Scale(bounds.Width(), bounds.Height())
                               .Then(Transform::Translation(bounds.left, bounds.top))
                               .Then(piece.m_ToPaper));
        m_Proof.EndGroup();
    }
    m_Proof.StrokePath(Renderer::Path::Rectangle(trim), Trim, Line(1.2 / m_Scale));
    DrawWords(std::to_string(piece.m_Index + 1), 0.3 * std::min(trim.Width(), trim.Height()),
              {(trim.left + trim.right) / 2, (trim.top + trim.bottom) / 2}, Number);
}

void PrintProofCommand::DrawWords(std::string const & words, double size, Kernel::Point const & centre,
                                  Raster::Colour const & colour)
{
    if (!m_Face) {
        return;
    }
    std::vector<Typeset::PlacedGlyph> glyphs;
    std::u16string text;
    double width = 0;
    for (char const letter : words) {
        Typeset::PlacedGlyph glyph;
        glyph.m_Glyph = static_cast<std::uint16_t>(m_Face->GetGlyph(static_cast<unsigned char>(letter)));
        glyph.m_Cluster = static_cast<std::uint32_t>(text.size());
        double const advance = m_Face->GlyphAdvance(glyph.m_Glyph) * size / m_Face->GetUnitsPerEm();
        glyph.m_Advance = static_cast<float>(advance);
        width += advance;
        text += static_cast<char16_t>(letter);
        glyphs.push_back(glyph);
    }
    RenderTree::GlyphRun run;
    run.m_Face = m_Face;
    run.m_Size = size;
    run.m_Colour = colour;
    // Digits and capitals are about seven tenths of the size high.
    run.m_Origin = {centre.x - width / 2, centre.y + 0.35 * size};
    m_Proof.DrawGlyphs(run, glyphs, text, 0);
}

ExportResult PrintProofCommand::Finish()
{
    Kernel::Consolidated<Raster::ICCProfile> const profile =
        Raster::ICCManager::GetInstance().GetDefaultProfileForFormat(Raster::Format::Rgba8);
    int const width = static_cast<int>(m_Columns * m_Cell.width + Margin);
    int const height = static_cast<int>(m_Rows * m_Cell.height + Margin);
    Kernel::Counted<Raster::DynamicBitmap> const bitmap =
        RenderTree::RasterSink(m_Schema).Draw(m_Proof, width, height, Transform(), nullptr);
    auto const data = Kernel::MakeCounted<Raster::CompressedRasterData>();
    if (!bitmap || !Raster::PNGBase(data, width, height, Raster::ExportOptions())
                        .Write(*bitmap, profile, profile, Raster::RenderingIntent::Perceptual, false)) {
        SetError(Kernel::LocalisedString("There is not enough memory for the proof.", "Output"));
        return ExportResultFailed;
    }
    Kernel::File::OpenUnmanagedResult result{};
    String message;
    Kernel::Counted<Kernel::FileOutStream> const stream =
        Kernel::FileOutStream::Create(m_Target.c_str(), Kernel::File::ShareMode::RespectLocks, result, &message);
    if (!stream) {
        SetError(message);
        return ExportResultFileNotCreated;
    }
    try {
        stream->Write(data->GetBytes().data(), data->GetBytes().size());
        if (!stream->Close()) {
            SetError(stream->GetError() ? String(stream->GetError()->what()) : String());
            return ExportResultWriteFailed;
        }
    } catch (Kernel::FileIOException const & exception) {
        SetError(exception.what());
        return ExportResultWriteFailed;
    }
    return ExportResultOk;
}

}
