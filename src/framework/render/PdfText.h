#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "framework/kernel/Geometry.h"
#include "framework/raster/AffineTransform.h"

namespace Renderer::RenderTree
{

/// Lengths in content streams are whole thousandths of a point, so that what a reader adds up is what the writer added.
using Thousandths = std::int64_t;

/// Rounded half away from zero. Values beyond what PDF readers take (ISO 32000-2, annex C) are cut to it, and what is
/// not a number is 0.
[[nodiscard]] Thousandths ToThousandths(double value);

/// Appends the number in the shortest form with a point as decimal sign: "-.5" is written "-0.5", 3000 as "3". Never
/// depends on the locale.
void AppendThousandths(std::string & text, Thousandths value);
inline void AppendNumber(std::string & text, double value)
{
    AppendThousandths(text, ToThousandths(value));
}
void AppendInteger(std::string & text, std::int64_t value);

/// The six numbers of a matrix with up to 6 decimals for its linear part, and a space after each.
void AppendMatrix(std::string & text, Raster::AffineTransform::Params const & matrix);

/// "x y " in points.
inline void AppendPoint(std::string & text, Kernel::Point const & point)
{
    AppendNumber(text, point.x);
    text += ' ';
    AppendNumber(text, point.y);
    text += ' ';
}

/// A text string object in UTF-16 with its byte order mark, in hexadecimal.
void AppendHexText(std::string & text, std::u16string_view value);

/// The value of a text string (ISO 32000-2, 7.9.2.2): bytes of PDFDocEncoding where ASCII suffices, otherwise UTF-16BE
/// with its mark. Damaged UTF-8 becomes U+FFFD.
[[nodiscard]] std::string TextString(std::string_view utf8);

/// A date string (ISO 32000-2, 7.9.4) of seconds since 1970, in UTC, and the same by ISO 8601 for XMP.
[[nodiscard]] std::string PdfDate(std::int64_t seconds);
[[nodiscard]] std::string XmpDate(std::int64_t seconds);

}
