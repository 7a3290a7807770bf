#pragma once

#include "core/BookController.h"

#include <memory>
#include <string>
#include <vector>

/// Occupies a book's queue while it lives, without the book's lock, so that a test can look at what is handed in to it.
class HeldQueue
{
public:
    explicit HeldQueue(Kernel::Counted<Book::BookController> const & book);
    ~HeldQueue();
    HeldQueue(HeldQueue const &) = delete;
    HeldQueue & operator=(HeldQueue const &) = delete;

    /// Waits until all that was posted so far has been delivered, takes off the queue what was handed in since it is
    /// held, and lets it go. Gives the commands' class names in their order, without the namespace of the books; none of
    /// them runs.
    [[nodiscard]] std::vector<std::string> Take();

private:
    struct State;
    std::shared_ptr<State> const m_State;
    bool m_Held = true;
};
