#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/LocalisedString.h"
#include "framework/kernel/Notification.h"

#include <functional>
#include <vector>

/// One change, or one piece of work, as an object. Built on any thread, handed to a queue once, run there.
class Command : public virtual Kernel::Countable
{
public:
    /// For the user: in the undo menu, on a progress bar, in a message.
    [[nodiscard]] virtual Kernel::LocalisedString GetDescription() const = 0;
    virtual void Do() = 0;
    virtual void Undo() = 0;
    /// Does it again after an `Undo`. By default the same as `Do`.
    virtual void Redo();
    /// It will not be done, undone or redone again: let go of what only served that.
    virtual void Teardown() {}
    /// Appends what it has to say after `Do`, `Undo` or `Redo`, on the thread that ran it, under the same lock.
    virtual void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) = 0;
    /// Takes over what `next` would do. Only called if `CanMerge` said so; `next` is then dropped.
    virtual void Merge(Kernel::Counted<Command const> next);
    /// Whether running this one alone can do the work of both; neither has run. By default never.
    [[nodiscard]] virtual bool CanMerge(Kernel::Counted<Command const> next) const;

    /// Runs once at the command's end, on the thread that ran it, with its notifications posted and no lock held,
    /// before a waiter is woken: also if the command threw, was merged into another (then at that one's end), or was
    /// emptied out. Not for a command that the queue refused. Set it before the command is handed in; it replaces one
    /// set earlier. It must not throw.
    void SetCompletionCallback(std::function<void()> callback);

    /// For who runs the command: takes its callbacks away, so that they run once; and lets it answer for those of a
    /// command that was folded into it.
    [[nodiscard]] std::vector<std::function<void()>> TakeCompletionCallbacks();
    void AddCompletionCallbacks(std::vector<std::function<void()>> callbacks);

private:
    std::vector<std::function<void()>> m_CompletionCallbacks;
};
