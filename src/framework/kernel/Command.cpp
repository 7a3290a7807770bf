#include "framework/kernel/Command.h"

#include "framework/kernel/Assert.h"

#include <iterator>
#include <utility>

void Command::Redo()
{
    Do();
}

void Command::Merge(Kernel::Counted<Command const>)
{
    KORVANE_ASSERT_MESSAGE(false, "a command that says it can merge has to override Merge");
}

bool Command::CanMerge(Kernel::Counted<Command const>) const
{
    return false;
}

void Command::SetCompletionCallback(std::function<void()> callback)
{
    m_CompletionCallbacks.clear();
    if (callback) {
        m_CompletionCallbacks.push_back(std::move(callback));
    }
}

std::vector<std::function<void()>> Command::TakeCompletionCallbacks()
{
    return std::exchange(m_CompletionCallbacks, {});
}

void Command::AddCompletionCallbacks(std::vector<std::function<void()>> callbacks)
{
    m_CompletionCallbacks.insert(m_CompletionCallbacks.end(), std::make_move_iterator(callbacks.begin()),
                                 std::make_move_iterator(callbacks.end()));
}
