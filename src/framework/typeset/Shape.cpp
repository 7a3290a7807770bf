#include "framework/typeset/Shape.h"

#include <algorithm>

namespace Typeset
{

void BumpArena::Grow(std::size_t size)
{
    std::size_t const chunk = std::max(size, ChunkSize);
    m_Chunks.push_back(std::make_unique_for_overwrite<std::byte[]>(chunk));
    m_Next = m_Chunks.back().get();
    m_Left = chunk;
    m_Size += chunk;
    if (m_Chunks.size() == 1) {
        m_FirstSize = chunk;
    }
}

void BumpArena::Clear()
{
    if (m_Chunks.empty()) {
        return;
    }
    m_Chunks.resize(1);
    m_Next = m_Chunks.front().get();
    m_Left = m_FirstSize;
    m_Size = m_FirstSize;
}

}
