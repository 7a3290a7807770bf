#include "framework/document/BookSinkCollection.h"

#include <algorithm>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <vector>

namespace
{

struct Entry
{
    BookSink * m_Sink = nullptr;
    int m_Calls = 0;
    bool m_Gone = false;
};

struct Sinks
{
    std::mutex m_Lock;
    std::condition_variable m_CallEnded;
    std::vector<std::shared_ptr<Entry>> m_Entries;
};

/// Never destroyed: sinks unregister when the program's static objects go.
Sinks & GetSinks()
{
    static Sinks * const sinks = new Sinks;
    return *sinks;
}

/// Calls of sinks that are under way on this thread.
thread_local int callsOfThread = 0;

}

void BookSinkCollection::RegisterBookSink(BookSink * sink)
{
    Sinks & sinks = GetSinks();
    auto const entry = std::make_shared<Entry>();
    entry->m_Sink = sink;
    std::lock_guard const lock(sinks.m_Lock);
    sinks.m_Entries.push_back(entry);
}

void BookSinkCollection::UnregisterBookSink(BookSink * sink)
{
    Sinks & sinks = GetSinks();
    std::unique_lock lock(sinks.m_Lock);
    auto const found = std::find_if(sinks.m_Entries.begin(), sinks.m_Entries.end(),
                                    [&](std::shared_ptr<Entry> const & entry) { return entry->m_Sink == sink; });
    if (found == sinks.m_Entries.end()) {
        return;
    }
    std::shared_ptr<Entry> const entry = *found;
    sinks.m_Entries.erase(found);
    entry->m_Gone = true;
    // A sink that unregisters while it answers does not wait for itself.
    sinks.m_CallEnded.wait(lock, [&] { return entry->m_Calls == 0 || callsOfThread > 0; });
}

bool BookSinkCollection::Ask(std::function<bool(BookSink &)> const & ask)
{
    Sinks & sinks = GetSinks();
    std::unique_lock lock(sinks.m_Lock);
    std::vector<std::shared_ptr<Entry>> const entries = sinks.m_Entries;
    for (std::shared_ptr<Entry> const & entry : entries) {
        if (entry->m_Gone) {
            continue;
        }
        ++entry->m_Calls;
        ++callsOfThread;
        lock.unlock();
        bool const taken = ask(*entry->m_Sink);
        lock.lock();
        --callsOfThread;
        --entry->m_Calls;
        sinks.m_CallEnded.notify_all();
        if (taken) {
            return true;
        }
    }
    return false;
}
