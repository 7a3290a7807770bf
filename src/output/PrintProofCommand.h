#pragma once

#include "framework/render/Schema.h"
#include "framework/typeset/FontFace.h"
#include "output/PrintCommand.h"

namespace Book
{

/// Draws sheets into one PNG picture, as a printer checks an imposition: paper, outline and number of each page, bleed,
/// crop marks, and the page's content lightly in it, which shows where the heads are.
///
/// The target is whole or untouched.
class PrintProofCommand final : public PrintCommand
{
    KORVANE_BOOK_COMMAND(PrintProofCommand);

public:
    /// Sides that one picture has room for; those behind are left out.
    static constexpr std::size_t MostSheets = 48;

    PrintProofCommand(std::vector<PaginatorPage> sheets, PrintSettings const & settings, String target);

protected:
    PrintProofCommand() = default;

    [[nodiscard]] ExportResult Begin(std::map<int, PrintedPage> const & pages) override;
    [[nodiscard]] bool TakePage(int index, PrintedPage const & page,
                                Renderer::RenderTree::DisplayList const & content) override;
    [[nodiscard]] bool MakeSheet(PaginatorPage const & sheet) override;
    [[nodiscard]] ExportResult Finish() override;

private:
    /// A page as it was drawn.
    struct Picture
    {
        Kernel::Rect m_Bounds;
        Kernel::Counted<Raster::DynamicBitmap> m_Bitmap;
    };

    void DrawPiece(PrintSheet::Piece const & piece);
    void DrawWords(std::string const & words, double size, Kernel::Point const & centre, Raster::Colour const & colour);

    String m_Target;
    Kernel::Counted<Renderer::RenderTree::Schema> m_Schema;
    Kernel::Counted<Typeset::FontFace const> m_Face;
    Renderer::RenderTree::DisplayList m_Proof;
    std::map<int, Picture> m_Pictures;
    /// Pixels to the point on paper, and to the point on each page.
    double m_Scale = 1;
    std::map<int, double> m_PageScales;
    /// Pixels.
    Kernel::Size m_Cell;
    int m_Columns = 1;
    int m_Rows = 1;
    int m_Done = 0;
};

}
