#pragma once

#include <deque>
#include <string>
#include <vector>

#include "framework/render/PageBoxes.h"
#include "framework/render/PdfBookmark.h"
#include "framework/render/PdfCompressor.h"
#include "framework/render/PdfResources.h"
#include "framework/render/PdfXmp.h"
#include "framework/render/Schema.h"

class Pipeline;

namespace Renderer::RenderTree
{

class PdfDrawings;
class PdfObjects;

/// A page that waits for the file to be put together.
struct PdfPageRecord
{
    SpillRange m_Content;
    std::uint32_t m_Uses = 0;
    /// Number of its set of boxes.
    std::uint32_t m_Boxes = 0;
    std::uint32_t m_FirstLink = 0;
    std::uint32_t m_LinkCount = 0;
    /// Top left of the trimmed page in the display list's coordinates.
    Kernel::Point m_Origin;
    String m_Label;
    /// Its part in the spread that the page before it began: 0 none, 1 to the right, 2 below.
    std::uint8_t m_Continues = 0;
};

/// Where something leads in the file.
struct PdfTarget
{
    /// Output page from 1; 0 for nowhere.
    int m_Page = 0;
    /// To a position; otherwise to the page as a whole.
    bool m_HasPosition = false;
    /// The position is a distance from the trimmed page's top left corner, y down; otherwise it is in the coordinates of
    /// the page's display list.
    bool m_FromTopLeft = false;
    Kernel::Point m_Position;
};

struct PdfLinkRecord
{
    /// In PDF coordinates of its page.
    Kernel::Rect m_Rect;
    PdfTarget m_Target;
    /// Number of an address or path plus 1; 0 for a target in this file.
    std::uint32_t m_Address = 0;
};

/// An address of another resource, or the path of another PDF file.
struct PdfAddress
{
    String m_Text;
    bool m_IsPdfFile = false;
    friend auto operator<=>(PdfAddress const &, PdfAddress const &) = default;
};

/// All that goes into a file but for the bytes in the spill.
struct PdfFile
{
    PdfResources m_Resources;
    /// Their addresses stay: a thread beside writes where contents lie.
    std::deque<PdfPageRecord> m_Pages;
    std::vector<PdfLinkRecord> m_Links;
    std::vector<PdfAddress> m_Addresses;
    /// Sets of boxes in PDF coordinates (y up: top is the greater number), each once.
    std::vector<PageBoxes> m_Boxes;
    std::vector<Kernel::Counted<PdfBookmark const>> m_Bookmarks;
    PdfInfo m_Info;
};

/// Puts the file together from what is in `objects` already and the records, and writes it. Throws what libqpdf, the compressor or the pipeline throw.
void WritePdfFile(PdfFile & file, PdfObjects & objects, PdfDrawings const & drawings, PdfCompressor & compressor,
                  PdfSchema const & schema, Pipeline & target);

}
