#pragma once

#include "framework/raster/Picture.h"

#include <string>
#include <vector>

/// Makes small PDF files to be placed, through libqpdf.
class PdfSketch
{
public:
    using Bytes = Raster::Picture::Bytes;

    /// Content streams, one a page.
    std::vector<std::string> m_Pages{"1 0 0 rg 0 0 20 20 re f"};
    /// Entries of each page's dictionary, as PDF text.
    std::string m_Keys = "/MediaBox[0 0 100 50]";
    /// Needed to open the file, if it is not empty.
    std::string m_Password;

    [[nodiscard]] Bytes Make() const;
};

/// A PDF file out of objects as text, numbered from 1, without a look at whether they make sense: "<</Type/Catalog...>>".
[[nodiscard]] Raster::Picture::Bytes RawPdf(std::vector<std::string> const & objects);

[[nodiscard]] Raster::Picture::Bytes ToBytes(std::string const & text);

/// An SVG of 100 by 50 pixels with this in it.
[[nodiscard]] Raster::Picture::Bytes SvgWith(std::string const & content);
