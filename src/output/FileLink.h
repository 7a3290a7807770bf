#pragma once

#include "framework/kernel/StringT.h"

namespace Book
{

/// A web address as a link holds it: "https://" goes in front of one without a protocol, and one backslash at its end
/// goes away.
[[nodiscard]] String WebAddress(String const & path);

/// The extension is exactly "pdf", in small letters.
[[nodiscard]] bool IsPdfPath(String const & path);

/// Copies the file at `path` into the folder of `pdfPath`, unless one of that name is there already, which is left
/// alone. `relative` becomes the copy's name, without a folder. False if the copy fails.
bool CopyBeside(String const & path, String const & pdfPath, String & relative);

}
