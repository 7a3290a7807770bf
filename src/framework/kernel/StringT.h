#pragma once

#include <atomic>
#include <compare>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <functional>
#include <iosfwd>
#include <string>
#include <string_view>

namespace Kernel
{

/// Tag of the UTF-8 encoding.
struct TEncUtf8
{
    using CharType = char;
};

/// Byte-wise comparison of character runs: no case folding, no normalisation.
template <typename TChar>
struct BaseCharTraits
{
    static bool IsEqual(std::basic_string_view<TChar> a, std::basic_string_view<TChar> b) noexcept { return a == b; }

    /// Below, at or above zero as `a` comes before, with or after `b` in the order of unsigned code units.
    static int Compare(std::basic_string_view<TChar> a, std::basic_string_view<TChar> b) noexcept
    {
        return a.compare(b);
    }
};

template <typename TEncoding>
class StringT;

/// Shared text in UTF-8. A copy shares the characters and bumps an atomic count, so a string may be copied and read on
/// any thread; it is never changed in place while it is shared. The length is kept. All empty strings are one static
/// text. The text ends in a zero byte that is not part of it; it may hold zero bytes of its own.
template <>
class StringT<TEncUtf8>
{
public:
    StringT() noexcept = default;
    StringT(char const * text) : StringT(text ? std::string_view(text) : std::string_view()) {}
    StringT(char const * text, std::size_t length) : StringT(std::string_view(text, length)) {}
    StringT(std::string const & text) : StringT(std::string_view(text)) {}
    StringT(std::string_view text);
    StringT(StringT const & other) noexcept : m_Text(other.m_Text) { Retain(); }
    StringT(StringT && other) noexcept : m_Text(other.m_Text) { other.m_Text = &ms_Empty; }
    ~StringT() { Release(); }

    StringT & operator=(StringT const & other) noexcept
    {
        StringT(other).Swap(*this);
        return *this;
    }
    StringT & operator=(StringT && other) noexcept
    {
        StringT(std::move(other)).Swap(*this);
        return *this;
    }

    void Swap(StringT & other) noexcept { std::swap(m_Text, other.m_Text); }

    /// The characters, ending in a zero byte; never null.
    [[nodiscard]] char const * Data() const noexcept { return m_Text->Characters(); }
    [[nodiscard]] char const * c_str() const noexcept { return Data(); }
    /// Bytes without the closing zero.
    [[nodiscard]] std::size_t Length() const noexcept { return m_Text->m_Length; }
    [[nodiscard]] bool Empty() const noexcept { return Length() == 0; }

    [[nodiscard]] std::string_view View() const noexcept { return {Data(), Length()}; }
    operator std::string_view() const noexcept { return View(); }
    [[nodiscard]] std::string ToStd() const { return std::string(View()); }

    /// Appends; the text becomes this string's own if it was shared.
    void Append(std::string_view text);
    StringT & operator+=(std::string_view text)
    {
        Append(text);
        return *this;
    }

    friend StringT operator+(StringT a, std::string_view b)
    {
        a.Append(b);
        return a;
    }

    friend bool operator==(StringT const & a, StringT const & b) noexcept
    {
        return a.m_Text == b.m_Text || a.View() == b.View();
    }
    friend bool operator==(StringT const & a, std::string_view b) noexcept { return a.View() == b; }
    friend bool operator==(StringT const & a, char const * b) noexcept { return a.View() == b; }
    friend std::strong_ordering operator<=>(StringT const & a, StringT const & b) noexcept
    {
        return a.View() <=> b.View();
    }

private:
    /// The count of the static empty text is never looked at.
    struct Text
    {
        std::atomic<std::uint32_t> m_Count;
        std::uint32_t m_Length;
        std::uint32_t m_Capacity;
        /// The characters follow the structure; this is the first of them.
        char m_First;

        [[nodiscard]] char * Characters() noexcept { return reinterpret_cast<char *>(this) + offsetof(Text, m_First); }
    };

    static Text * Allocate(std::size_t capacity);
    void Retain() const noexcept
    {
        if (m_Text != &ms_Empty) {
            m_Text->m_Count.fetch_add(1, std::memory_order_relaxed);
        }
    }
    void Release() const noexcept;

    static Text ms_Empty;
    Text * m_Text = &ms_Empty;
};

/// Prints the text, so that a failing test shows it.
std::ostream & operator<<(std::ostream & stream, StringT<TEncUtf8> const & text);

/// Joins the parts in order.
StringT<TEncUtf8> ConcatString(std::initializer_list<std::string_view> parts);

}

/// The string of the whole program.
using String = Kernel::StringT<Kernel::TEncUtf8>;

template <>
struct std::hash<String>
{
    std::size_t operator()(String const & text) const noexcept { return std::hash<std::string_view>()(text.View()); }
};
