#pragma once

#include <cstdint>
#include <string>

#include "framework/kernel/StringT.h"

namespace Renderer::RenderTree
{

/// What a file says of itself.
struct PdfInfo
{
    String m_Title;
    String m_Author;
    String m_Subject;
    /// Key words, separated by commas or semicolons.
    String m_Tags;
    /// BCP 47.
    String m_Language;
    /// Seconds since 1970.
    std::int64_t m_Time = 0;
};

/// The name of this program in the files that it makes.
inline constexpr char const * ProducerName = "Korvane Book";

/// The XMP packet (ISO 16684-1) that says the same as the document information, with room for later editing in place.
[[nodiscard]] std::string MakeXmpPacket(PdfInfo const & info);

}
