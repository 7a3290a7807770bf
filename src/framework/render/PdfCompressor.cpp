#include "framework/render/PdfCompressor.h"

#include <libdeflate.h>
#include <new>
#include <utility>

namespace Renderer::RenderTree
{

PdfCompressor::Deflater::Deflater() : m_Quick(libdeflate_alloc_compressor(1)), m_Thorough(libdeflate_alloc_compressor(6))
{
    if (!m_Quick || !m_Thorough) {
        libdeflate_free_compressor(m_Quick);
        libdeflate_free_compressor(m_Thorough);
        throw std::bad_alloc();
    }
}

PdfCompressor::Deflater::~Deflater()
{
    libdeflate_free_compressor(m_Quick);
    libdeflate_free_compressor(m_Thorough);
}

std::string_view PdfCompressor::Deflater::Compress(std::string_view data, Effort effort)
{
    libdeflate_compressor * const compressor = effort == Effort::Quick ? m_Quick : m_Thorough;
    m_Buffer.resize(std::max(m_Buffer.size(), libdeflate_zlib_compress_bound(compressor, data.size())));
    std::size_t const size =
        libdeflate_zlib_compress(compressor, data.data(), data.size(), m_Buffer.data(), m_Buffer.size());
    return std::string_view(m_Buffer).substr(0, size);
}

PdfCompressor::~PdfCompressor()
{
    {
        std::lock_guard const lock(m_Lock);
        m_Queue.clear();
        m_Stop = true;
    }
    m_Changed.notify_all();
    if (m_Thread.joinable()) {
        m_Thread.join();
    }
}

void PdfCompressor::Add(std::size_t size, Job job)
{
    std::unique_lock lock(m_Lock);
    if (!m_Thread.joinable()) {
        m_Thread = std::thread([this] { Work(); });
    }
    m_Changed.wait(lock, [this] { return m_QueuedBytes <= LargestQueue; });
    m_Queue.push_back({size, std::move(job)});
    m_QueuedBytes += size;
    lock.unlock();
    m_Changed.notify_all();
}

void PdfCompressor::RunOne(std::unique_lock<std::mutex> & lock, Deflater & deflater)
{
    Entry entry = std::move(m_Queue.front());
    m_Queue.pop_front();
    m_QueuedBytes -= entry.m_Size;
    ++m_Running;
    lock.unlock();
    m_Changed.notify_all();
    std::exception_ptr failure;
    try {
        entry.m_Job(deflater);
        entry.m_Job = nullptr;
    } catch (...) {
        failure = std::current_exception();
    }
    lock.lock();
    --m_Running;
    if (failure && !m_Failure) {
        m_Failure = failure;
    }
}

void PdfCompressor::Work()
{
    Deflater deflater;
    std::unique_lock lock(m_Lock);
    while (true) {
        m_Changed.wait(lock, [this] { return m_Stop || !m_Queue.empty(); });
        if (m_Queue.empty()) {
            return;
        }
        RunOne(lock, deflater);
        m_Changed.notify_all();
    }
}

void PdfCompressor::Finish()
{
    std::unique_lock lock(m_Lock);
    if (!m_Queue.empty()) {
        Deflater deflater;
        while (!m_Queue.empty()) {
            RunOne(lock, deflater);
        }
    }
    m_Changed.wait(lock, [this] { return m_Queue.empty() && m_Running == 0; });
    if (m_Failure) {
        std::rethrow_exception(std::exchange(m_Failure, nullptr));
    }
}

}
