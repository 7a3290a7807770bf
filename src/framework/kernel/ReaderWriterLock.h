#pragma once

#include "framework/kernel/ThreadNode.h"

#include <functional>
#include <memory>
#include <mutex>
#include <vector>

namespace Kernel
{

/// Many readers or one writer.
///
/// Fair both ways: a reader that comes while a writer waits lets it go first; a writer that leaves lets in all readers
/// that wait before the next writer. Both forms nest on a thread, and a writer may read. A reader must not ask for
/// writing.
///
/// A thread gets the lock at once if its holder is blocked on that thread (`WaitGraph`): it then borrows the holder's
/// lock, and the holder has it again when the borrower is done.
class ReaderWriterLock
{
public:
    ReaderWriterLock() = default;
    ReaderWriterLock(ReaderWriterLock const &) = delete;
    ReaderWriterLock & operator=(ReaderWriterLock const &) = delete;

    /// True if the thread did not hold it before in any form.
    bool AcquireReader();
    /// True if the thread does not hold it any more in any form.
    bool ReleaseReader();

    /// Asked every few milliseconds while readers keep a writer out: the first argument set lets readers in that wait
    /// behind it, the second ends the asking.
    using Periodic = std::function<void(bool & letReadersIn, bool & quiet)>;
    void AcquireWriter(Periodic const & periodic);
    /// True if the thread goes on reading: what it read under its own writing keeps writers out from now on.
    bool ReleaseWriter();

    /// Gives the thread's hold up, however deep it is; a lock that it has borrowed goes back to the lender. The result
    /// is for `TakeBack`; 0 if the thread does not hold it for writing.
    [[nodiscard]] int SetAside();
    void TakeBack(int depth);

    [[nodiscard]] bool IsHeldForWriting() const;
    [[nodiscard]] bool IsWriterWaiting() const;
    [[nodiscard]] bool IsReaderWaiting() const;

    /// Of a thread that holds it for writing, after a sleep in which others may have borrowed it: sleeps until they have
    /// given it back.
    void AwaitReturn();

    /// For the wait graph: adds the threads that keep a waiting thread out.
    void AddHolders(ThreadNode const & waiting, std::vector<ThreadNode const *> & holders) const;

private:
    struct Level
    {
        std::shared_ptr<ThreadNode> m_Thread;
        int m_Depth = 0;
    };
    struct Reader
    {
        std::shared_ptr<ThreadNode> m_Thread;
        int m_Depth = 0;
        /// Reads under the writer lock of its own thread, or of one that is blocked on it.
        bool m_UnderWriter = false;
    };
    struct Waiter
    {
        std::shared_ptr<ThreadNode> m_Thread;
        ThreadNode::Signal m_Signal;
    };

    [[nodiscard]] bool IsReadableAtOnce() const { return m_Levels.empty() && m_WaitingWriters.empty(); }
    [[nodiscard]] bool IsWritableAtOnce() const { return m_Levels.empty() && m_PlainReaders == 0; }
    [[nodiscard]] bool IsWriter(ThreadNode const & thread) const
    {
        return !m_Levels.empty() && m_Levels.back().m_Thread.get() == &thread;
    }
    /// The thread is the writer, and nobody else has borrowed the lock from it.
    [[nodiscard]] bool IsReturnedTo(ThreadNode const & thread) const;
    void WakeOwners();
    void PopLevel();
    /// The thread's entry of one kind, or null.
    [[nodiscard]] Reader * FindReader(ThreadNode const & thread, bool underWriter);
    void AddReader(std::shared_ptr<ThreadNode> const & thread, bool underWriter);
    void LetReadersIn();
    /// The lock is free, or read: lets in who waits. A writer that leaves lets readers go first, the last reader that
    /// leaves a writer.
    void LetNextIn(bool readersFirst);
    bool AcquireReaderSlowly(std::shared_ptr<ThreadNode> const & thread);
    void AcquireWriterSlowly(std::shared_ptr<ThreadNode> const & thread, Periodic const & periodic);

    mutable std::mutex m_Lock;
    /// The writer, and below it those whose lock it has borrowed; empty if nobody writes.
    std::vector<Level> m_Levels;
    std::vector<Reader> m_Readers;
    /// Entries of `m_Readers` that keep writers out.
    int m_PlainReaders = 0;
    /// In the order of coming; they live on their threads' stacks.
    std::vector<Waiter *> m_WaitingReaders;
    std::vector<Waiter *> m_WaitingWriters;
    /// Those who have lent the lock and wait for it.
    std::vector<Waiter *> m_WaitingOwners;
};

}
