#pragma once

#include "framework/kernel/Counted.h"

#include <atomic>
#include <cstdint>

class BroadcastNotification;

namespace Kernel
{

/// Base of every message that leaves a command or a controller for the front end and the other layers.
///
/// Made and filled on one thread, then posted; nobody changes it from then on. Sinks may keep it as long as they like.
class Notification : public virtual Countable
{
public:
    Notification() = default;
    /// A copy has not been posted.
    Notification(Notification const & other) : Countable(other), m_TellWhenPassed(other.m_TellWhenPassed) {}
    Notification & operator=(Notification const &) { return *this; }

    /// Two notifications of one batch and one class with the same id say the same thing, and the later one is dropped.
    /// 0, the default: never.
    [[nodiscard]] virtual int GetDedupeId() const { return 0; }

    /// One notification in place of this and a later one of the same class and batch, or null, the default, to keep
    /// both. The result takes this one's place in the order.
    [[nodiscard]] virtual Counted<Notification> Merge(Counted<Notification> later);

    /// Also sent while commands run as a preview that is taken back again.
    [[nodiscard]] virtual bool RequiredForPreviewing() const { return false; }
    /// What the front end does on it counts in the time that a user waits for a reaction.
    [[nodiscard]] virtual bool FrontEndProcessingTimeIsCritical() const { return false; }
    /// Of use to a document that is held still by its book.
    [[nodiscard]] virtual bool MustProcessWithoutBookLock() const { return false; }

    /// Its place in the order of all postings of the process, from 1; 0 until it is posted.
    [[nodiscard]] std::uint64_t GetPostingNumber() const { return m_PostingNumber.load(std::memory_order_acquire); }

protected:
    /// Every sink that was registered when it was posted has returned from `Notify`. Runs once a posting, on the line
    /// that was last, or on a thread of its own if there was no sink; it must neither wait nor throw. Only for classes
    /// whose constructor calls `TellWhenPassed`.
    virtual void OnPassedEveryLine() {}
    void TellWhenPassed() { m_TellWhenPassed = true; }
    /// For `OnPassedEveryLine`: somebody has kept the notification. If not, it is about to go.
    [[nodiscard]] bool IsKept() const { return ReferenceCount() > 1; }

private:
    friend class ::BroadcastNotification;

    std::atomic<std::uint64_t> m_PostingNumber{0};
    bool m_TellWhenPassed = false;
};

}
