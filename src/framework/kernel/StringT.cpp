#include "framework/kernel/StringT.h"

#include "framework/kernel/Assert.h"

#include <algorithm>
#include <limits>
#include <new>
#include <ostream>

namespace Kernel
{

StringT<TEncUtf8>::Text StringT<TEncUtf8>::ms_Empty{1, 0, 0, 0};

StringT<TEncUtf8>::Text * StringT<TEncUtf8>::Allocate(std::size_t capacity)
{
    KORVANE_ASSERT(capacity < std::numeric_limits<std::uint32_t>::max() - 64);
    void * memory = ::operator new(std::max(offsetof(Text, m_First) + capacity + 1, sizeof(Text)));
    auto * text = static_cast<Text *>(memory);
    new (&text->m_Count) std::atomic<std::uint32_t>(1);
    text->m_Length = 0;
    text->m_Capacity = static_cast<std::uint32_t>(capacity);
    return text;
}

StringT<TEncUtf8>::StringT(std::string_view text)
{
    if (text.empty()) {
        return;
    }
    m_Text = Allocate(text.size());
    std::memcpy(m_Text->Characters(), text.data(), text.size());
    m_Text->Characters()[text.size()] = 0;
    m_Text->m_Length = static_cast<std::uint32_t>(text.size());
}

void StringT<TEncUtf8>::Release() const noexcept
{
    if (m_Text != &ms_Empty && m_Text->m_Count.fetch_sub(1, std::memory_order_acq_rel) == 1) {
        ::operator delete(m_Text);
    }
}

void StringT<TEncUtf8>::Append(std::string_view text)
{
    if (text.empty()) {
        return;
    }
    std::size_t const length = Length();
    std::size_t const wanted = length + text.size();
    bool const shared = m_Text == &ms_Empty || m_Text->m_Count.load(std::memory_order_acquire) != 1;
    if (shared || wanted > m_Text->m_Capacity) {
        Text * grown = Allocate(wanted + (shared ? 0 : wanted / 2));
        std::memcpy(grown->Characters(), Data(), length);
        std::memcpy(grown->Characters() + length, text.data(), text.size());
        Release();
        m_Text = grown;
    } else {
        std::memmove(m_Text->Characters() + length, text.data(), text.size());
    }
    m_Text->m_Length = static_cast<std::uint32_t>(wanted);
    m_Text->Characters()[wanted] = 0;
}

std::ostream & operator<<(std::ostream & stream, StringT<TEncUtf8> const & text)
{
    return stream << text.View();
}

StringT<TEncUtf8> ConcatString(std::initializer_list<std::string_view> parts)
{
    std::string joined;
    for (std::string_view part : parts) {
        joined.append(part);
    }
    return StringT<TEncUtf8>(joined);
}

}
