#pragma once

#include <optional>

#include "framework/kernel/Geometry.h"
#include "framework/kernel/HashAccumulator.h"
#include "framework/raster/Picture.h"

namespace Renderer::RenderTree
{

/// A drawing that is placed as it is, with its paths and fonts: one page of a PDF file, or an SVG file.
///
/// Opening it reads its structure and size; what it draws is read when it is asked for. Immutable: any thread may call
/// anything at any time. Files may be broken or hostile: all operations give a problem then, in bounded time and memory.
class PlacedDrawing : public virtual Kernel::Countable
{
public:
    /// The numbers are written in files.
    enum class Kind : std::uint8_t
    {
        Pdf = 1,
        Svg = 2
    };
    using Bytes = Raster::Picture::Bytes;
    using Problem = Raster::PictureProblem;

    /// What to open.
    struct Source
    {
        Bytes m_Bytes;
        /// Name in messages; what an SVG links to is looked for in this file's folder.
        String m_Path;
        /// From 1. An SVG has one page.
        int m_Page = 1;
        /// Of a protected PDF. Never shown and never saved.
        String m_Password;
    };

    /// Greatest width and height in points: beyond it no page can show a drawing.
    static constexpr double LargestSide = 14400;

    /// What a file's content is, by its beginning; nothing if it is neither.
    [[nodiscard]] static std::optional<Kind> KindOf(std::vector<unsigned char> const & bytes);

    /// Null with a reason in `problem`: `Locked` for a PDF whose password is not (or not rightly) given, `NoSuchPage`,
    /// `TooLarge`, or what is broken.
    [[nodiscard]] static Kernel::Counted<PlacedDrawing const> Open(Source source, Problem & problem);

    /// The first page of a file on disk.
    [[nodiscard]] static Kernel::Counted<PlacedDrawing const> OpenFile(String const & path, String const & password,
                                                                       Problem & problem);

    [[nodiscard]] Kind GetKind() const { return m_Kind; }
    [[nodiscard]] String const & GetPath() const { return m_Source.m_Path; }
    [[nodiscard]] int GetPage() const { return m_Source.m_Page; }
    [[nodiscard]] String const & GetPassword() const { return m_Source.m_Password; }
    /// Of the file's bytes: pages of one file have the same.
    [[nodiscard]] Kernel::Hash128 const & GetFileHash() const { return m_Hash; }
    /// In points, as the drawing is shown: cropped, turned upright, in its own unit.
    [[nodiscard]] Kernel::Size const & GetSize() const { return m_Size; }

    /// A PDF file that holds the drawing: the file itself, or an SVG's drawing as one page. Null with a reason.
    [[nodiscard]] Bytes ReadAsPdf(Problem & problem) const;
    /// The page of `ReadAsPdf`.
    [[nodiscard]] int GetPdfPage() const { return Kind::Pdf == m_Kind ? m_Source.m_Page : 1; }

    /// The drawing in that many pixels, on a transparent ground, in sRGB. Null with a reason; `Unsupported` if the
    /// program that draws PDF pages is not installed.
    [[nodiscard]] Kernel::Counted<Raster::DynamicBitmap const> Draw(int width, int height, Problem & problem) const;

    /// Pages of PDFs can be drawn in pixels on this machine.
    [[nodiscard]] static bool CanDrawPdfPages();

private:
    PlacedDrawing() = default;

    Source m_Source;
    Kind m_Kind = Kind::Pdf;
    Kernel::Hash128 m_Hash;
    Kernel::Size m_Size;
};

}
