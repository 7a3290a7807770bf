#include "framework/render/PlacedDrawing.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/LocalisedString.h"
#include "framework/render/PdfPreview.h"
#include "framework/render/PdfSource.h"
#include "framework/render/SvgReader.h"

#include <algorithm>
#include <cmath>
#include <string_view>

namespace Renderer::RenderTree
{

namespace
{

using Code = Raster::PictureProblem::Code;

/// Largest files that are read.
constexpr std::size_t LargestPdf = std::size_t(1) << 30;
constexpr std::size_t LargestSvg = std::size_t(32) << 20;

/// A PDF's header may come after other bytes, as mail and web programs put them there (ISO 32000-2, annex I).
constexpr std::size_t PdfHeaderWithin = 1024;
/// An SVG's root comes after comments and declarations.
constexpr std::size_t SvgRootWithin = std::size_t(64) << 10;

bool IsSvg(std::string_view text)
{
    text = text.substr(text.starts_with("\xEF\xBB\xBF") ? 3 : 0);
    std::size_t const begin = text.find_first_not_of(" \t\r\n");
    return std::string_view::npos != begin && '<' == text[begin] &&
           (std::string_view::npos != text.find("<svg") || std::string_view::npos != text.find(":svg"));
}

}

std::optional<PlacedDrawing::Kind> PlacedDrawing::KindOf(std::vector<unsigned char> const & bytes)
{
    std::string_view const text(reinterpret_cast<char const *>(bytes.data()), bytes.size());
    if (std::string_view::npos != text.substr(0, PdfHeaderWithin).find("%PDF-")) {
        return Kind::Pdf;
    }
    return IsSvg(text.substr(0, SvgRootWithin)) ? std::optional(Kind::Svg) : std::nullopt;
}

Kernel::Counted<PlacedDrawing const> PlacedDrawing::Open(Source source, Problem & problem)
{
    KORVANE_ASSERT(source.m_Bytes);
    std::optional<Kind> const kind = KindOf(*source.m_Bytes);
    if (!kind) {
        Raster::Report(problem, Code::UnknownKind, source.m_Path,
                       Kernel::LocalisedString("is neither PDF nor SVG", "Picture"));
        return nullptr;
    }
    if ((Kind::Pdf == *kind ? LargestPdf : LargestSvg) < source.m_Bytes->size()) {
        Raster::Report(problem, Code::TooLarge, source.m_Path,
                       Kernel::LocalisedString("is too large a file", "Picture"));
        return nullptr;
    }
    Kernel::Counted<PlacedDrawing> const drawing(new PlacedDrawing);
    drawing->m_Kind = *kind;
    drawing->m_Hash = Kernel::HashBytes128(source.m_Bytes->data(), source.m_Bytes->size());
    if (Kind::Svg == *kind) {
        if (1 != source.m_Page) {
            Raster::Report(problem, Code::NoSuchPage, source.m_Path,
                           Kernel::LocalisedString("is an SVG, which has one page only", "Picture"));
            return nullptr;
        }
        std::optional<Kernel::Size> const size = ReadSvgSize(*source.m_Bytes, source.m_Path, problem);
        if (!size) {
            return nullptr;
        }
        drawing->m_Size = *size;
    } else {
        std::unique_ptr<PdfSource> const pdf =
            PdfSource::Open(source.m_Bytes, source.m_Path, source.m_Password, problem);
        std::optional<PdfSource::Page> const page = pdf ? pdf->FindPage(source.m_Page, problem) : std::nullopt;
        if (!page) {
            return nullptr;
        }
        drawing->m_Size = page->GetSize();
    }
    Kernel::Size const & size = drawing->m_Size;
    if (!(0.01 <= size.width && size.width <= LargestSide && 0.01 <= size.height && size.height <= LargestSide)) {
        Raster::Report(problem, Code::TooLarge, source.m_Path,
                       Kernel::LocalisedString("is smaller or larger than any page can be", "Picture"));
        return nullptr;
    }
    drawing->m_Source = std::move(source);
    return Kernel::Counted<PlacedDrawing const>(drawing);
}

Kernel::Counted<PlacedDrawing const> PlacedDrawing::OpenFile(String const & path, String const & password,
                                                             Problem & problem)
{
    Bytes const bytes = Raster::ReadPictureFile(path, problem);
    return bytes ? Open({bytes, path, 1, password}, problem) : nullptr;
}

bool PlacedDrawing::CanDrawPdfPages()
{
    return RenderTree::CanDrawPdfPages();
}

PlacedDrawing::Bytes PlacedDrawing::ReadAsPdf(Problem & problem) const
{
    return Kind::Pdf == m_Kind ? m_Source.m_Bytes
                               : SvgToPdf(*m_Source.m_Bytes, m_Source.m_Path, m_Size, problem);
}

Kernel::Counted<Raster::DynamicBitmap const> PlacedDrawing::Draw(int width, int height, Problem & problem) const
{
    KORVANE_ASSERT(0 < width && 0 < height);
    if (Kind::Svg == m_Kind) {
        return DrawSvg(*m_Source.m_Bytes, m_Source.m_Path, width, height, problem);
    }
    std::unique_ptr<PdfSource> const pdf =
        PdfSource::Open(m_Source.m_Bytes, m_Source.m_Path, m_Source.m_Password, problem);
    return pdf ? DrawPdfPage(*pdf, m_Source.m_Page, width, height, problem) : nullptr;
}

}
