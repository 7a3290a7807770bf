#include "framework/kernel/ReaderWriterLock.h"

#include "framework/kernel/Assert.h"

#include <algorithm>
#include <utility>

namespace Kernel
{

namespace
{

constexpr int PeriodOfAsking = 5;

}

ReaderWriterLock::Reader * ReaderWriterLock::FindReader(ThreadNode const & thread, bool underWriter)
{
    auto const found = std::find_if(m_Readers.begin(), m_Readers.end(), [&](Reader const & reader) {
        return reader.m_Thread.get() == &thread && reader.m_UnderWriter == underWriter;
    });
    return found == m_Readers.end() ? nullptr : &*found;
}

void ReaderWriterLock::AddReader(std::shared_ptr<ThreadNode> const & thread, bool underWriter)
{
    m_Readers.push_back({thread, 1, underWriter});
    m_PlainReaders += underWriter ? 0 : 1;
}

bool ReaderWriterLock::AcquireReader()
{
    std::shared_ptr<ThreadNode> const & thread = ThreadNode::Current();
    {
        std::lock_guard const lock(m_Lock);
        bool const writes = IsWriter(*thread);
        if (Reader * const reader = FindReader(*thread, writes)) {
            ++reader->m_Depth;
            return false;
        }
        if (writes || IsReadableAtOnce()) {
            AddReader(thread, writes);
            return !writes;
        }
    }
    return AcquireReaderSlowly(thread);
}

bool ReaderWriterLock::AcquireReaderSlowly(std::shared_ptr<ThreadNode> const & thread)
{
    Waiter waiter{thread, {}};
    {
        WaitGraph::Step step;
        std::vector<ThreadNode const *> holders;
        AddHolders(*thread, holders);
        bool const blocked = std::any_of(holders.begin(), holders.end(), [&](ThreadNode const * holder) {
            return step.IsBlockedOn(holder, *thread);
        });
        std::lock_guard const lock(m_Lock);
        if (!m_Levels.empty() && blocked) {
            step.EnterLoan(*m_Levels.back().m_Thread, *this);
            if (Reader * const reader = FindReader(*thread, true)) {
                ++reader->m_Depth;
                return false;
            }
            AddReader(thread, true);
            return false;
        }
        // A reader that is blocked on this thread keeps out the writer that waits: behind it nobody would ever move.
        if (IsReadableAtOnce() || (m_Levels.empty() && blocked)) {
            AddReader(thread, false);
            return true;
        }
        m_WaitingReaders.push_back(&waiter);
        step.EnterLockWait(*thread, *this);
    }
    thread->Sleep(waiter.m_Signal);
    WaitGraph::EndWait(*thread);
    thread->AwaitLentLocks();
    return true;
}

bool ReaderWriterLock::ReleaseReader()
{
    ThreadNode const & thread = *ThreadNode::CurrentPointer();
    std::lock_guard const lock(m_Lock);
    bool const writes = IsWriter(thread);
    Reader * reader = FindReader(thread, writes);
    if (!reader) {
        reader = FindReader(thread, !writes);
    }
    KORVANE_ASSERT_MESSAGE(reader, "a reader lock is released by a thread that does not hold it");
    if (--reader->m_Depth > 0) {
        return false;
    }
    bool const plain = !reader->m_UnderWriter;
    m_Readers.erase(m_Readers.begin() + (reader - m_Readers.data()));
    if (!plain) {
        WakeOwners();
    } else if (--m_PlainReaders == 0) {
        LetNextIn(false);
    }
    return plain;
}

void ReaderWriterLock::AcquireWriter(Periodic const & periodic)
{
    std::shared_ptr<ThreadNode> const & thread = ThreadNode::Current();
    {
        std::lock_guard const lock(m_Lock);
        if (IsWriter(*thread)) {
            ++m_Levels.back().m_Depth;
            return;
        }
        KORVANE_ASSERT_MESSAGE(!FindReader(*thread, false), "a reader asks for the writer lock: it would wait for itself");
        if (IsWritableAtOnce() && m_WaitingWriters.empty()) {
            m_Levels.push_back({thread, 1});
            return;
        }
    }
    AcquireWriterSlowly(thread, periodic);
}

void ReaderWriterLock::AcquireWriterSlowly(std::shared_ptr<ThreadNode> const & thread, Periodic const & periodic)
{
    Waiter waiter{thread, {}};
    {
        WaitGraph::Step step;
        std::vector<ThreadNode const *> holders;
        AddHolders(*thread, holders);
        bool const blocked = std::any_of(holders.begin(), holders.end(), [&](ThreadNode const * holder) {
            return step.IsBlockedOn(holder, *thread);
        });
        std::lock_guard const lock(m_Lock);
        if (IsWritableAtOnce() && m_WaitingWriters.empty()) {
            m_Levels.push_back({thread, 1});
            return;
        }
        if (blocked) {
            KORVANE_ASSERT_MESSAGE(!m_Levels.empty(),
                                   "a thread that holds a lock for reading waits for one that asks for it for writing");
            step.EnterLoan(*m_Levels.back().m_Thread, *this);
            m_Levels.push_back({thread, 1});
            return;
        }
        m_WaitingWriters.push_back(&waiter);
        step.EnterLockWait(*thread, *this);
    }
    bool quiet = !periodic;
    while (!quiet && !thread->SleepFor(waiter.m_Signal, PeriodOfAsking)) {
        bool letReadersIn = false;
        periodic(letReadersIn, quiet);
        if (letReadersIn) {
            std::lock_guard const lock(m_Lock);
            if (m_Levels.empty()) {
                LetReadersIn();
            }
        }
    }
    thread->Sleep(waiter.m_Signal);
    WaitGraph::EndWait(*thread);
    thread->AwaitLentLocks();
}

bool ReaderWriterLock::IsReturnedTo(ThreadNode const & thread) const
{
    return IsWriter(thread) && std::none_of(m_Readers.begin(), m_Readers.end(), [&](Reader const & reader) {
               return reader.m_UnderWriter && reader.m_Thread.get() != &thread;
           });
}

void ReaderWriterLock::WakeOwners()
{
    std::erase_if(m_WaitingOwners, [this](Waiter * waiter) {
        std::shared_ptr<ThreadNode> const thread = waiter->m_Thread;
        bool const returned = IsReturnedTo(*thread);
        if (returned) {
            thread->Give(waiter->m_Signal);
        }
        return returned;
    });
}

void ReaderWriterLock::AwaitReturn()
{
    std::shared_ptr<ThreadNode> const & thread = ThreadNode::Current();
    Waiter waiter{thread, {}};
    {
        WaitGraph::Step step;
        std::vector<ThreadNode const *> holders;
        AddHolders(*thread, holders);
        bool const blocked = std::any_of(holders.begin(), holders.end(), [&](ThreadNode const * holder) {
            return step.IsBlockedOn(holder, *thread);
        });
        std::lock_guard const lock(m_Lock);
        auto const own = std::find_if(m_Levels.begin(), m_Levels.end(),
                                      [&](Level const & level) { return level.m_Thread == thread; });
        if (own == m_Levels.end() || IsReturnedTo(*thread)) {
            return;
        }
        if (blocked) {
            // The borrower sleeps, and waits for this thread in its turn: now this one borrows.
            if (!IsWriter(*thread)) {
                step.EnterLoan(*m_Levels.back().m_Thread, *this);
                std::rotate(own, own + 1, m_Levels.end());
            }
            return;
        }
        m_WaitingOwners.push_back(&waiter);
        step.EnterLockWait(*thread, *this);
    }
    thread->Sleep(waiter.m_Signal);
    WaitGraph::EndWait(*thread);
}

bool ReaderWriterLock::ReleaseWriter()
{
    ThreadNode const & thread = *ThreadNode::CurrentPointer();
    std::lock_guard const lock(m_Lock);
    KORVANE_ASSERT_MESSAGE(IsWriter(thread), "a writer lock is released by a thread that does not hold it");
    if (--m_Levels.back().m_Depth > 0) {
        return false;
    }
    // With a lender below it the lender's lock still covers the reading.
    Reader * const reading = m_Levels.size() == 1 ? FindReader(thread, true) : nullptr;
    if (reading) {
        reading->m_UnderWriter = false;
        ++m_PlainReaders;
    }
    PopLevel();
    return reading != nullptr;
}

int ReaderWriterLock::SetAside()
{
    std::lock_guard const lock(m_Lock);
    if (!IsWriter(*ThreadNode::CurrentPointer())) {
        return 0;
    }
    int const depth = m_Levels.back().m_Depth;
    PopLevel();
    return depth;
}

void ReaderWriterLock::TakeBack(int depth)
{
    AcquireWriter(nullptr);
    std::lock_guard const lock(m_Lock);
    m_Levels.back().m_Depth += depth - 1;
}

void ReaderWriterLock::PopLevel()
{
    m_Levels.pop_back();
    if (m_Levels.empty()) {
        LetNextIn(true);
    } else {
        WakeOwners();
    }
}

void ReaderWriterLock::LetReadersIn()
{
    for (Waiter * const waiter : std::exchange(m_WaitingReaders, {})) {
        std::shared_ptr<ThreadNode> const thread = waiter->m_Thread;
        AddReader(thread, false);
        thread->Give(waiter->m_Signal);
    }
}

void ReaderWriterLock::LetNextIn(bool readersFirst)
{
    if (!m_Levels.empty()) {
        return;
    }
    if (!m_WaitingReaders.empty() && (readersFirst || m_WaitingWriters.empty())) {
        LetReadersIn();
    } else if (m_PlainReaders == 0 && !m_WaitingWriters.empty()) {
        Waiter * const waiter = m_WaitingWriters.front();
        m_WaitingWriters.erase(m_WaitingWriters.begin());
        std::shared_ptr<ThreadNode> const thread = waiter->m_Thread;
        m_Levels.push_back({thread, 1});
        thread->Give(waiter->m_Signal);
    }
}

bool ReaderWriterLock::IsHeldForWriting() const
{
    std::lock_guard const lock(m_Lock);
    return IsWriter(*ThreadNode::CurrentPointer());
}

bool ReaderWriterLock::IsWriterWaiting() const
{
    std::lock_guard const lock(m_Lock);
    return !m_WaitingWriters.empty();
}

bool ReaderWriterLock::IsReaderWaiting() const
{
    std::lock_guard const lock(m_Lock);
    return !m_WaitingReaders.empty();
}

void ReaderWriterLock::AddHolders(ThreadNode const & waiting, std::vector<ThreadNode const *> & holders) const
{
    std::lock_guard const lock(m_Lock);
    if (!m_Levels.empty()) {
        if (m_Levels.back().m_Thread.get() != &waiting) {
            holders.push_back(m_Levels.back().m_Thread.get());
            return;
        }
        for (Reader const & reader : m_Readers) {
            if (reader.m_UnderWriter && reader.m_Thread.get() != &waiting) {
                holders.push_back(reader.m_Thread.get());
            }
        }
        return;
    }
    for (Reader const & reader : m_Readers) {
        if (!reader.m_UnderWriter && reader.m_Thread.get() == &waiting) {
            // It has been let in and is about to wake.
            return;
        }
    }
    for (Reader const & reader : m_Readers) {
        if (!reader.m_UnderWriter) {
            holders.push_back(reader.m_Thread.get());
        }
    }
}

}
