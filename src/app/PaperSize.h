#pragma once

#include "framework/kernel/Geometry.h"

#include <optional>
#include <string>
#include <string_view>

namespace App
{

/// A length with its unit, in points: "12mm", "0.5in", "1.2cm", "36pt"; a bare number counts points. Nothing if it can't
/// be read, is negative, or is beyond 100 metres.
[[nodiscard]] std::optional<double> ReadLength(std::string_view text);

/// Two lengths "WxH", or one for both: "10x5mm", "3mm". A unit at the end counts for both.
[[nodiscard]] std::optional<Kernel::Size> ReadLengths(std::string_view text);

/// A paper by name (A0 to A8, B3 to B6, Letter, Legal, Tabloid, Executive; in any case) or as "WxH". Never without
/// width or height.
[[nodiscard]] std::optional<Kernel::Size> ReadPaper(std::string_view text);

/// A factor: "0.7" or "70%". From a hundredth to a hundred times.
[[nodiscard]] std::optional<double> ReadScale(std::string_view text);

}
