#pragma once

#include <cstddef>
#include <cstdint>
#include <mutex>
#include <string>
#include <vector>

namespace Renderer::RenderTree
{

/// Where a stretch of bytes lies in the spill.
struct SpillRange
{
    std::uint64_t m_Offset = 0;
    std::uint64_t m_Length = 0;
};

/// A nameless temporary file that holds finished streams until the PDF is put together, so that they need no memory.
/// Appends go through a buffer. Safe on any thread once it is open.
class PdfSpill
{
public:
    PdfSpill() = default;
    ~PdfSpill();
    PdfSpill(PdfSpill const &) = delete;
    PdfSpill & operator=(PdfSpill const &) = delete;

    /// Makes the file in the folder for temporary files. False with `error` as a sentence if that fails.
    [[nodiscard]] bool Open(std::string & error);

    /// Appends, and says where. After a failed write the ranges mean nothing, and `GetError` says why.
    SpillRange Append(void const * data, std::size_t size);
    /// Reads a stretch back. False if it can't be read.
    [[nodiscard]] bool Read(SpillRange const & range, std::uint64_t offset, void * target, std::size_t size);

    [[nodiscard]] std::string GetError() const;

private:
    bool Flush();

    mutable std::mutex m_Lock;
    int m_File = -1;
    std::uint64_t m_Written = 0;
    std::vector<char> m_Buffer;
    std::string m_Error;
};

}
