#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"
#include "framework/kernel/UnitValueConverter.h"
#include "framework/render/DisplayList.h"
#include "framework/render/PageBoxes.h"
#include "framework/render/PdfBookmark.h"
#include "framework/render/PdfHyperlink.h"
#include "framework/render/Schema.h"
#include "framework/render/Warning.h"

namespace Kernel
{
class OutStream;
}

namespace Renderer::RenderTree
{

/// What `PdfExport::AddForm` keeps, placed on a page.
struct PlacedForm
{
    int m_Form = -1;
    /// From the coordinates of the form's list to those of the page.
    Raster::AffineTransform::Params m_Transform;
    /// What of it shows, in coordinates of the page.
    Kernel::Rect m_Clip;
};

/// Frame of one page that is written.
struct PdfPage
{
    PageBoxes m_Boxes;
    /// The printed folio, such as "iv" or "A-12"; empty for a page without one.
    String m_Label;
    /// For marks outside of the page; may be null.
    Kernel::Counted<PrintersMarksHelper const> m_PrintersMarks;
    /// Whether this page is the next one of the spread that the page before it began. A position on that page which lies
    /// beyond its right or lower edge is then a position on this one: links are given in coordinates of spreads.
    enum class Continues : std::uint8_t
    {
        Nothing,
        Beside,
        Below
    };
    Continues m_ContinuesSpread = Continues::Nothing;
    /// Drawn beneath the page's own content, in this order.
    std::vector<PlacedForm> m_Forms;
};

/// Writes one PDF file (ISO 32000-2) page by page: `Create`, `WritePage` for each page in order, `AddBookmarks`, `Close`.
///
/// A page's content is compressed on a thread of its own and kept, compressed, in a temporary file until `Close`, which
/// writes the whole file to the stream; so memory grows by a few hundred bytes a page and link, not with their content.
/// Fonts are subset at the end and pictures that occur again are written once. With a fixed time in the options the same
/// calls give the same bytes.
///
/// Used by one thread at a time. Nothing throws; a failure is remembered, makes later calls do nothing, and shows in
/// `Close` and `GetError`.
class PdfExport
{
public:
    /// The converter may be null.
    PdfExport(Kernel::Counted<PdfSchema> schema, Kernel::Counted<Kernel::UnitValueConverter const> converter);
    ~PdfExport();
    PdfExport(PdfExport const &) = delete;
    PdfExport & operator=(PdfExport const &) = delete;

    /// Begins the file. `filename` is what the file will be called in the end; nothing is written there. False if the
    /// temporary file can't be had. The texts may be empty.
    [[nodiscard]] bool Create(char const * filename, Kernel::Counted<Kernel::OutStream> const & stream,
                              String const & subject, String const & title, String const & author,
                              String const & tags);

    /// The name given to `Create`.
    [[nodiscard]] String const & GetFilename() const;
    [[nodiscard]] PdfSchema const & GetSchema() const;

    /// Keeps what a list draws within `bounds`, for pages that come later to show it, any number of times: its content,
    /// fonts and pictures are in the file once. The form's number; -1 if the export has failed or was aborted.
    /// `warnings` may be null.
    [[nodiscard]] int AddForm(DisplayList const & content, Kernel::Rect const & bounds,
                              std::vector<Warning> * warnings);

    /// Appends a page; the first has number 1. Links may lead to pages that come later. False if the export has failed
    /// or was aborted. `warnings` may be null.
    [[nodiscard]] bool WritePage(PdfPage const & page, DisplayList const & content,
                                 std::vector<PdfHyperlink> const & links, std::vector<Warning> * warnings);

    /// Pages so far.
    [[nodiscard]] int GetPageCount() const;

    /// Adds entries to the outline, each parent ahead of its children.
    void AddBookmarks(std::vector<Kernel::Counted<PdfBookmark const>> const & bookmarks);

    /// Writes the file to the stream, and leaves the stream open. False if anything has failed, was aborted, or if there
    /// is no page. A second call does nothing and returns what the first did.
    [[nodiscard]] bool Close();

    /// Why the export failed, in one sentence; empty while it has not.
    [[nodiscard]] String const & GetError() const;

private:
    class State;
    std::unique_ptr<State> m_State;
};

}
