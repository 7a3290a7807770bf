#pragma once

#include <memory>
#include <optional>
#include <string>

#include "framework/kernel/Geometry.h"
#include "framework/raster/Picture.h"
#include "framework/render/Qpdf.h"

namespace Renderer::RenderTree
{

/// A PDF file that pages are taken from. Used by one thread at a time: libqpdf reads objects when they are looked at.
///
/// The file may be damaged, as far as it can be repaired, or hostile: the page tree is walked without recursion, and
/// what only unpacks to something huge is refused before it is unpacked.
class PdfSource
{
public:
    using Bytes = Raster::Picture::Bytes;
    using Handle = QPDFObjectHandle;

    struct Page
    {
        Handle m_Object;
        /// Own or inherited; null if there are none.
        Handle m_Resources;
        /// What of the page shows, in its own coordinates, y up: bottom is the lesser number.
        Kernel::Rect m_Box;
        /// Quarter turns clockwise, 0 to 3.
        int m_Turns = 0;
        /// Points to the unit (ISO 32000-2, 14.11.2).
        double m_Unit = 1;

        /// As shown, in points.
        [[nodiscard]] Kernel::Size GetSize() const;
        /// The matrix that takes what shows to the unit square, upright, with (0,0) at the bottom left.
        [[nodiscard]] std::string GetMatrix() const;
    };

    /// The most that a page's instructions, or the file's own tables, may unpack to.
    static constexpr std::size_t LargestUnpacked = std::size_t(256) << 20;

    /// Null with a reason: `Locked` if the password is missing or wrong.
    [[nodiscard]] static std::unique_ptr<PdfSource> Open(Bytes bytes, String const & path, String const & password,
                                                         Raster::PictureProblem & problem);

    /// Page of that number, from 1. Nothing with a reason, `NoSuchPage` if the file has fewer.
    [[nodiscard]] std::optional<Page> FindPage(int number, Raster::PictureProblem & problem);

    /// What the page draws, as one stream's bytes. With `m_Filter` null they are plain, otherwise packed as the file has
    /// them.
    struct Content
    {
        std::string m_Bytes;
        Handle m_Filter;
        Handle m_Parameters;
    };
    /// Throws what libqpdf throws, and `std::runtime_error` for content that unpacks to too much.
    [[nodiscard]] Content ReadContent(Page const & page);

    [[nodiscard]] QPDF & GetPdf() { return m_Pdf; }
    [[nodiscard]] String const & GetPath() const { return m_Path; }
    /// What libqpdf had to put right, in one sentence; empty if nothing since the last call.
    [[nodiscard]] std::string TakeWarning();

private:
    PdfSource() = default;

    String m_Path;
    Bytes m_Bytes;
    QPDF m_Pdf;
};

}
