#pragma once

#include <memory>
#include <string>
#include <unordered_map>
#include <vector>

#include "framework/kernel/Geometry.h"
#include "framework/kernel/StringT.h"
#include "framework/raster/ICCProfile.h"
#include "framework/render/PdfCompressor.h"
#include "framework/render/PdfSpill.h"
#include "framework/render/PdfText.h"
#include "framework/render/Qpdf.h"


namespace Renderer::RenderTree
{

/// Makes libqpdf's objects for one file. Names and numbers are immutable and may stand in many places; libqpdf spends
/// some 200 bytes on each, so those that occur over and over are made once.
class PdfObjects
{
public:
    using Handle = QPDFObjectHandle;

    explicit PdfObjects(PdfSpill & spill);

    [[nodiscard]] QPDF & GetPdf() { return m_Pdf; }
    [[nodiscard]] PdfSpill & GetSpill() { return m_Spill; }

    /// `name` is a literal, with its slash: it is known again by its address.
    Handle Name(char const * name);
    /// Rounded to thousandths.
    Handle Number(double value);
    [[nodiscard]] static Handle Text(String const & text);
    /// Readers take left, bottom, right, top.
    Handle Box(Kernel::Rect const & rect);

    /// A stream whose bytes lie in the spill. `filter` is null for none.
    Handle SpilledStream(SpillRange const & range, char const * filter);
    /// Packs a profile and makes its stream.
    Handle MakeProfile(Raster::ICCProfile const & profile);

private:
    class SpillProvider;

    static constexpr std::size_t MostNumbers = 20000;

    PdfSpill & m_Spill;
    std::shared_ptr<SpillProvider> m_Provider;
    QPDF m_Pdf;
    std::unordered_map<char const *, Handle> m_Names;
    std::unordered_map<Thousandths, Handle> m_Numbers;
};

}
