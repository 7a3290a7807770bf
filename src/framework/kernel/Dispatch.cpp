#include "framework/kernel/Dispatch.h"

#include "framework/kernel/CriticalSection.h"

#include <algorithm>
#include <atomic>
#include <condition_variable>
#include <deque>
#include <exception>
#include <memory>
#include <pthread.h>
#include <sched.h>
#include <thread>
#include <vector>

namespace Kernel
{

namespace
{

std::atomic<int> s_ThreadLimit{0};

/// One call of DispatchParallelFor: indexes are handed out one by one, so that uneven work spreads evenly.
struct Job
{
    void (*m_Work)(void *, unsigned long long);
    void * m_Context;
    unsigned long long m_Count;
    Dispatch::ThreadPurpose m_Purpose;
    std::atomic<unsigned long long> m_Next{0};
    std::mutex m_Lock;
    std::condition_variable m_Ended;
    int m_Running = 0;
    std::exception_ptr m_Error;

    void Run()
    {
        for (;;) {
            unsigned long long const index = m_Next.fetch_add(1, std::memory_order_relaxed);
            if (m_Count <= index) {
                return;
            }
            try {
                m_Work(m_Context, index);
            } catch (...) {
                m_Next.store(m_Count, std::memory_order_relaxed);
                std::lock_guard lock(m_Lock);
                if (!m_Error) {
                    m_Error = std::current_exception();
                }
                return;
            }
        }
    }
};

void NameThread(Dispatch::ThreadPurpose purpose)
{
    static constexpr char const * Names[] = {"helper", "render helper", "compose helper", "file helper"};
    pthread_setname_np(pthread_self(), Names[static_cast<int>(purpose)]);
}

/// The helpers: started when first needed, kept to the end of the program, asleep between jobs.
class Helpers
{
public:
    static Helpers & Get()
    {
        static Helpers helpers;
        return helpers;
    }

    ~Helpers()
    {
        {
            std::lock_guard lock(m_Lock);
            m_Stop = true;
        }
        m_Wake.notify_all();
        for (std::thread & thread : m_Threads) {
            thread.join();
        }
    }

    void Offer(std::shared_ptr<Job> const & job, int places, Dispatch::DispatchPriority priority)
    {
        std::lock_guard lock(m_Lock);
        int const idle = static_cast<int>(m_Threads.size()) - m_Busy - static_cast<int>(m_Offers.size());
        if (priority == Dispatch::DispatchPriority::Low) {
            places = std::min(places, m_Busy == 0 ? places : std::max(idle, 0));
        }
        for (int i = 0; i < places; ++i) {
            if (priority == Dispatch::DispatchPriority::High) {
                m_Offers.push_front(job);
            } else {
                m_Offers.push_back(job);
            }
        }
        int const limit = Dispatch::GetNumberOfRealCPUs() - 1;
        while (static_cast<int>(m_Threads.size()) < std::max(limit, places)) {
            m_Threads.emplace_back([this] { Serve(); });
        }
        m_Wake.notify_all();
    }

    /// Takes back the offers that no helper has taken up, so that the caller need not wait for busy helpers.
    void Withdraw(std::shared_ptr<Job> const & job)
    {
        std::lock_guard lock(m_Lock);
        std::erase(m_Offers, job);
    }

private:
    void Serve()
    {
        std::unique_lock lock(m_Lock);
        for (;;) {
            m_Wake.wait(lock, [this] { return m_Stop || !m_Offers.empty(); });
            if (m_Stop) {
                return;
            }
            std::shared_ptr<Job> const job = m_Offers.front();
            m_Offers.pop_front();
            ++m_Busy;
            {
                // Counted while the offer is still guarded: after Withdraw the caller waits for exactly those who run.
                std::lock_guard jobLock(job->m_Lock);
                ++job->m_Running;
            }
            lock.unlock();
            NameThread(job->m_Purpose);
            job->Run();
            {
                std::lock_guard jobLock(job->m_Lock);
                --job->m_Running;
                job->m_Ended.notify_all();
            }
            lock.lock();
            --m_Busy;
        }
    }

    std::mutex m_Lock;
    std::condition_variable m_Wake;
    std::deque<std::shared_ptr<Job>> m_Offers;
    std::vector<std::thread> m_Threads;
    int m_Busy = 0;
    bool m_Stop = false;
};

}

void Dispatch::DispatchParallelFor(void (*work)(void *, unsigned long long), unsigned long long count, void * context,
                                   DispatchPriority priority, ThreadPurpose purpose)
{
    int const limit = s_ThreadLimit.load(std::memory_order_relaxed);
    auto const threads = static_cast<unsigned long long>(limit == 0 ? GetNumberOfRealCPUs() : limit);
    if (count <= 1 || threads <= 1) {
        for (unsigned long long index = 0; index < count; ++index) {
            work(context, index);
        }
        return;
    }
    auto const job = std::make_shared<Job>();
    job->m_Work = work;
    job->m_Context = context;
    job->m_Count = count;
    job->m_Purpose = purpose;
    Helpers::Get().Offer(job, static_cast<int>(std::min(threads, count) - 1), priority);
    job->Run();
    Helpers::Get().Withdraw(job);
    std::unique_lock lock(job->m_Lock);
    job->m_Ended.wait(lock, [&] { return job->m_Running == 0; });
    if (job->m_Error) {
        std::rethrow_exception(job->m_Error);
    }
}

void Dispatch::ParallelFor(unsigned long long count, std::function<void(unsigned long long)> const & work)
{
    using Work = std::function<void(unsigned long long)>;
    DispatchParallelFor([](void * context, unsigned long long index) { (*static_cast<Work const *>(context))(index); },
                        count, const_cast<Work *>(&work), DispatchPriority::Normal, ThreadPurpose::General);
}

int Dispatch::GetNumberOfRealCPUs()
{
    static int const number = [] {
        cpu_set_t set;
        int const count = ::sched_getaffinity(0, sizeof(set), &set) == 0
                              ? CPU_COUNT(&set)
                              : static_cast<int>(std::thread::hardware_concurrency());
        return std::max(count, 1);
    }();
    return number;
}

void Dispatch::SetThreadLimit(int threads)
{
    s_ThreadLimit.store(threads, std::memory_order_relaxed);
}

}
