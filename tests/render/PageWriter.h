#pragma once

#include "framework/kernel/MemoryStreams.h"
#include "framework/render/PdfExport.h"
#include "framework/typeset/FontFace.h"
#include "support/PdfProbe.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

/// Makes small PDF files for tests: pages of 300 by 400 points, a fixed time, no document above.
class PageWriter
{
public:
    static constexpr Kernel::Rect Page{0, 0, 300, 400};

    PageWriter() { m_Settings.m_FixedTime = 1'700'000'000; }

    /// Before the first page.
    Renderer::FileExportOptionsPDF::Settings m_Settings;
    Raster::Format m_Format = Raster::Format::Rgba8;
    String m_Title = "A title";

    Renderer::RenderTree::PdfExport & GetExport();
    /// Writes a page and expects that to work.
    void Write(Renderer::RenderTree::DisplayList const & list);
    void Write(Renderer::RenderTree::DisplayList const & list, Renderer::RenderTree::PdfPage const & page,
               std::vector<Renderer::PdfHyperlink> const & links);
    /// Closes, expects that to work, and gives the bytes.
    std::string Finish();
    /// The same, put into a file for a look inside, after `qpdf --check` has found nothing.
    PdfProbe & Probe();

    [[nodiscard]] std::vector<Renderer::RenderTree::Warning> const & GetWarnings() const { return m_Warnings; }

private:
    TemporaryFolder m_Folder;
    Kernel::Counted<Kernel::MemoryOutStream> m_Stream;
    std::unique_ptr<Renderer::RenderTree::PdfExport> m_Export;
    std::unique_ptr<PdfProbe> m_Probe;
    std::vector<Renderer::RenderTree::Warning> m_Warnings;
};

/// Fonts that are installed with the project.
[[nodiscard]] Kernel::Counted<Typeset::FontFace const> Garamond();
[[nodiscard]] Kernel::Counted<Typeset::FontFace const> Liberation();
[[nodiscard]] Kernel::Counted<Typeset::FontFace const> FaceAt(char const * path);

/// Draws a line of text, shaped by HarfBuzz with the face's own features; `level` 1 for right to left.
void DrawText(Renderer::RenderTree::DisplayList & list, Kernel::Counted<Typeset::FontFace const> const & face,
              double size, Kernel::Point const & origin, std::u16string_view text, int level);
