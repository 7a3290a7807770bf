#pragma once

#include <condition_variable>
#include <deque>
#include <functional>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

struct libdeflate_compressor;

namespace Renderer::RenderTree
{

/// Works beside the thread that makes pages: compresses finished contents and subsets fonts. Jobs may end in any order;
/// whoever adds one reads its result after `Finish`. The queue is bounded, so a writer that is faster than the disk waits
/// here and memory stays flat.
class PdfCompressor
{
public:
    /// What a job compresses with; one for each thread.
    class Deflater
    {
    public:
        Deflater();
        ~Deflater();
        Deflater(Deflater const &) = delete;
        Deflater & operator=(Deflater const &) = delete;

        /// How hard to try. Page contents gain a twentieth of their size by three times the work, and a book is full of
        /// them; fonts and pictures gain more.
        enum class Effort
        {
            Quick,
            Thorough,
        };

        /// The bytes in zlib form. The view is valid until the next call.
        [[nodiscard]] std::string_view Compress(std::string_view data, Effort effort);

    private:
        libdeflate_compressor * m_Quick;
        libdeflate_compressor * m_Thorough;
        std::string m_Buffer;
    };

    using Job = std::function<void(Deflater &)>;

    PdfCompressor() = default;
    /// Drops jobs that have not begun.
    ~PdfCompressor();
    PdfCompressor(PdfCompressor const &) = delete;
    PdfCompressor & operator=(PdfCompressor const &) = delete;

    /// Takes a job that holds about `size` bytes; waits while more than the bound is queued.
    void Add(std::size_t size, Job job);
    /// Works on the queue with the calling thread too, and returns when every job has ended. Throws what the first
    /// failed job threw.
    void Finish();

private:
    static constexpr std::size_t LargestQueue = std::size_t(8) << 20;

    struct Entry
    {
        std::size_t m_Size;
        Job m_Job;
    };

    void Work();
    /// Takes and runs one job; the lock is given up meanwhile.
    void RunOne(std::unique_lock<std::mutex> & lock, Deflater & deflater);

    std::mutex m_Lock;
    std::condition_variable m_Changed;
    std::deque<Entry> m_Queue;
    std::size_t m_QueuedBytes = 0;
    int m_Running = 0;
    bool m_Stop = false;
    std::exception_ptr m_Failure;
    std::thread m_Thread;
};

}
