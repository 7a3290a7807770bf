#pragma once

#include <cstddef>
#include <memory>
#include <span>
#include <type_traits>
#include <utility>
#include <vector>

namespace Story
{

/// An array that either has its elements or looks at them in a loaded block, which it then keeps alive. Appending to
/// an array that only looks is a programming mistake.
template <typename T>
class FlatArray
{
    static_assert(std::is_trivially_copyable_v<T>);

public:
    FlatArray() = default;
    explicit FlatArray(std::vector<T> elements) : m_Own(std::move(elements)) {}
    /// Looks at `view`, which lies in what `block` owns and is aligned for T.
    FlatArray(std::shared_ptr<void const> block, std::span<T const> view) : m_Block(std::move(block)), m_View(view) {}

    [[nodiscard]] std::span<T const> View() const { return m_Block ? m_View : std::span<T const>(m_Own); }
    [[nodiscard]] std::size_t Size() const { return View().size(); }
    [[nodiscard]] bool Empty() const { return View().empty(); }
    T const & operator[](std::size_t index) const { return View()[index]; }
    [[nodiscard]] auto begin() const { return View().begin(); }
    [[nodiscard]] auto end() const { return View().end(); }
    /// Elements `first` to `first + count`.
    [[nodiscard]] std::span<T const> Range(std::size_t first, std::size_t count) const
    {
        return View().subspan(first, count);
    }

    /// The elements, for whoever builds the array.
    [[nodiscard]] std::vector<T> & Own() { return m_Own; }

private:
    std::vector<T> m_Own;
    std::shared_ptr<void const> m_Block;
    std::span<T const> m_View;
};

}
