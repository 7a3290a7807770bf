#pragma once

#include <cstddef>
#include <vector>

namespace Renderer::RenderTree
{

/// Whether the tables of a PDF file, its object and cross-reference streams, unpack to more than `limit` bytes in all, or
/// are packed in ways that no writer uses for them. libqpdf unpacks them whole when it opens a file, and a few kilobytes
/// can stand for terabytes there.
///
/// Looks at the bytes alone, in one pass: what stands before each "stream" keyword says what it is.
[[nodiscard]] bool UnpacksTooFar(std::vector<unsigned char> const & bytes, std::size_t limit);

}
