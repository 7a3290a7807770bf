#pragma once

#include <deque>
#include <map>
#include <memory>
#include <tuple>
#include <vector>

#include "framework/render/DisplayList.h"
#include "framework/render/PdfObjectCopier.h"
#include "framework/render/PdfObjects.h"
#include "framework/render/PdfSource.h"
#include "framework/render/Warning.h"

namespace Renderer::RenderTree
{

/// Takes placed drawings into the output as form XObjects (ISO 32000-2, 8.10) that fill the unit square: paths, fonts and
/// pictures as they are, in their own colours. A page that is placed often is taken once, and pages of one file share
/// what they shared there, as long as they follow each other within a few other files.
class PdfDrawings
{
public:
    using Handle = QPDFObjectHandle;

    /// One drawing of the file.
    struct Form
    {
        Handle m_Object;
        /// Its page was blended as a group.
        bool m_IsGroup = false;
    };

    /// Borrows both.
    PdfDrawings(PdfObjects & objects, PdfSpill & spill) : m_Objects(objects), m_Spill(spill) {}

    /// Warnings from here on belong to that page; `warnings` may be null.
    void BeginPage(int page, std::vector<Warning> * warnings);

    /// The form that shows the drawing, its number in `GetForms`. False if it can't be had; the warning tells why.
    [[nodiscard]] bool FormFor(PlacedDrawing const & drawing, std::uint32_t & form);
    [[nodiscard]] std::vector<Form> const & GetForms() const { return m_Forms; }

    /// The layers that the drawings have, and which of them do not show, for the catalogue (ISO 32000-2, 8.11.4); null if
    /// there are none.
    [[nodiscard]] Handle MakeLayers() const;

private:
    /// A file that pages are taken from.
    struct OpenFile
    {
        Kernel::Hash128 m_Hash;
        std::unique_ptr<PdfSource> m_Source;
        std::unique_ptr<PdfObjectCopier> m_Copier;
    };
    /// What is told once for a page that is placed often.
    struct Known
    {
        std::uint32_t m_Form = 0;
        Raster::PictureProblem m_Problem;
    };

    /// Files that stay open, so that their next page finds its fonts in the output.
    static constexpr std::size_t MostOpenFiles = 4;

    OpenFile * OpenFor(PlacedDrawing const & drawing, Raster::PictureProblem & problem);
    bool Take(PlacedDrawing const & drawing, std::uint32_t & form, Raster::PictureProblem & problem);
    void TakeLayers(OpenFile & file);

    PdfObjects & m_Objects;
    PdfSpill & m_Spill;
    PdfCompressor::Deflater m_Deflater;
    std::vector<Form> m_Forms;
    std::map<std::tuple<std::uint64_t, std::uint64_t, int, String>, Known> m_Known;
    std::deque<OpenFile> m_Files;
    std::vector<Handle> m_Layers;
    std::vector<Handle> m_HiddenLayers;
    int m_Page = 0;
    std::vector<Warning> * m_Warnings = nullptr;
};

}
