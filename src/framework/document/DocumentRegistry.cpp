#include "framework/document/DocumentRegistry.h"

#include "framework/document/DocumentController.h"
#include "framework/kernel/Assert.h"
#include "framework/kernel/Scheduler.h"

#include <algorithm>
#include <utility>

namespace
{

std::string Key(String const & path)
{
    return std::string(path.View());
}

}

DocumentRegistry::RecordPointer DocumentRegistry::Find(DocumentController const & document) const
{
    auto const found = m_ByController.find(&document);
    return found == m_ByController.end() ? nullptr : found->second;
}

DocumentRegistry::RecordPointer DocumentRegistry::Find(std::string const & path) const
{
    auto const found = m_ByPath.find(path);
    return found == m_ByPath.end() ? nullptr : found->second;
}

void DocumentRegistry::Enter(RecordPointer const & record)
{
    record->m_Order = ++m_LastOrder;
    // A use that was counted too late of a document long gone, at the same address, says nothing of this one.
    m_LateUses.erase(record->m_Controller.Get());
    m_ByController[record->m_Controller.Get()] = record;
    if (!record->m_Path.empty()) {
        m_ByPath[record->m_Path] = record;
    }
}

bool DocumentRegistry::ClaimForLoading(String const & path, Document & controller,
                                       std::function<void()> const & beforeWaiting)
{
    std::string const key = Key(path);
    bool isPrepared = !beforeWaiting;
    RecordPointer awaited;
    std::thread::id const thread = std::this_thread::get_id();
    std::unique_lock lock(m_Lock);
    for (;;) {
        RecordPointer const record = Find(key);
        if (!record) {
            auto const claim = std::make_shared<Record>();
            claim->m_Path = key;
            claim->m_Controller = controller;
            claim->m_Loader = thread;
            Enter(claim);
            return true;
        }
        if (record->m_State == State::Open) {
            if (record != awaited) {
                record->m_Promised.push_back(thread);
            }
            Document open = record->m_Controller;
            lock.unlock();
            controller.Swap(open);
            return false;
        }
        KORVANE_ASSERT_MESSAGE(record->m_State != State::Loading || record->m_Loader != thread,
                               "a thread claims a path that it is loading itself");
        if (record->m_State == State::Loading && !std::exchange(isPrepared, true)) {
            lock.unlock();
            beforeWaiting();
            lock.lock();
            continue;
        }
        if (record->m_State == State::Loading && record != awaited) {
            record->m_Awaiting.push_back(thread);
            awaited = record;
        }
        Document const closing = record->m_State == State::Closing ? record->m_Controller : nullptr;
        if (closing && closing->IsCommandEnqueueDisabled()) {
            // Its last turn is in the queue: run it here if nobody is at it.
            lock.unlock();
            closing->WaitUntilCommandQueueEmpty();
            lock.lock();
            if (Find(key) != record) {
                continue;
            }
        }
        // Closing is over when the record has gone; the last turn's arrival is worth another look.
        bool const disabled = closing && closing->IsCommandEnqueueDisabled();
        Kernel::Scheduler::Wait const wait;
        m_Changed.wait(lock, [&] {
            return Find(key) != record || record->m_State == State::Open ||
                   (closing && !disabled && closing->IsCommandEnqueueDisabled());
        });
    }
}

void DocumentRegistry::EndLoading(String const & path, Document controller, bool inFront)
{
    RecordPointer record;
    {
        std::lock_guard const lock(m_Lock);
        record = Find(Key(path));
        KORVANE_ASSERT_MESSAGE(record && record->m_State == State::Loading, "a path is unregistered that nobody loads");
        if (!controller) {
            m_ByPath.erase(record->m_Path);
            m_ByController.erase(record->m_Controller.Get());
        } else {
            KORVANE_ASSERT_MESSAGE(controller == record->m_Controller, "another document was loaded than was claimed");
            record->m_State = State::Open;
            record->m_InFront = inFront;
            record->m_Listed = inFront;
            record->m_Promised = std::move(record->m_Awaiting);
            if (!inFront) {
                record->m_Promised.push_back(std::this_thread::get_id());
            }
        }
    }
    m_Changed.notify_all();
}

bool DocumentRegistry::AddInFront(Document controller)
{
    auto const record = std::make_shared<Record>();
    record->m_Path = Key(controller->GetPath());
    record->m_Controller = std::move(controller);
    record->m_State = State::Open;
    record->m_InFront = true;
    record->m_Listed = true;
    std::lock_guard const lock(m_Lock);
    if ((!record->m_Path.empty() && Find(record->m_Path)) || Find(*record->m_Controller)) {
        return false;
    }
    Enter(record);
    return true;
}

bool DocumentRegistry::TakeInFront(DocumentController const & document)
{
    std::lock_guard const lock(m_Lock);
    RecordPointer const record = Find(document);
    if (!record || record->m_State != State::Open) {
        return false;
    }
    auto const promised =
        std::find(record->m_Promised.begin(), record->m_Promised.end(), std::this_thread::get_id());
    if (promised != record->m_Promised.end()) {
        record->m_Promised.erase(promised);
    }
    record->m_KeepUnsaved = false;
    record->m_Listed = true;
    return !std::exchange(record->m_InFront, true);
}

void DocumentRegistry::AddUse(DocumentController const & document)
{
    std::lock_guard const lock(m_Lock);
    RecordPointer const record = Find(document);
    if (!record || record->m_State != State::Open) {
        ++m_LateUses[&document];
        return;
    }
    ++record->m_Uses;
    auto const promised =
        std::find(record->m_Promised.begin(), record->m_Promised.end(), std::this_thread::get_id());
    if (promised != record->m_Promised.end()) {
        record->m_Promised.erase(promised);
    }
}

bool DocumentRegistry::EndUse(DocumentController const & document, bool & keepUnsaved)
{
    for (bool fenced = false;; fenced = true) {
        {
            std::lock_guard const lock(m_Lock);
            auto const late = m_LateUses.find(&document);
            if (late != m_LateUses.end()) {
                if (--late->second > 0) {
                    return false;
                }
                // Its file was closed by somebody else: the caller only has to forget it.
                m_LateUses.erase(late);
                keepUnsaved = true;
                return true;
            }
            RecordPointer const record = Find(document);
            if (!record || record->m_Uses == 0) {
                return false;
            }
            bool const last = record->m_Uses == 1 && !record->m_InFront && record->m_Promised.empty();
            if (!last || fenced) {
                --record->m_Uses;
                if (last) {
                    record->m_State = State::Closing;
                    keepUnsaved = record->m_KeepUnsaved;
                }
                return last;
            }
        }
        // Commands that nobody waits for must not be lost, or come after the question whether it is dirty.
        document.WaitUntilCommandQueueEmpty();
    }
}

DocumentRegistry::Leaving DocumentRegistry::Leave(DocumentController const & document, bool discard)
{
    std::lock_guard const lock(m_Lock);
    RecordPointer const record = Find(document);
    if (!record || record->m_State == State::Loading) {
        return Leaving::NotOurs;
    }
    if (record->m_State == State::Closing) {
        return Leaving::AlreadyClosing;
    }
    bool const used = record->m_Uses > 0 || !record->m_Promised.empty();
    if (!record->m_InFront && used) {
        return Leaving::NotOurs;
    }
    record->m_InFront = false;
    if (used) {
        record->m_KeepUnsaved = discard;
        return Leaving::Demoted;
    }
    record->m_State = State::Closing;
    return Leaving::Closing;
}

void DocumentRegistry::LastTurnIsWaiting()
{
    {
        std::lock_guard const lock(m_Lock);
    }
    m_Changed.notify_all();
}

void DocumentRegistry::Closed(DocumentController const & document)
{
    RecordPointer record;
    {
        std::lock_guard const lock(m_Lock);
        record = Find(document);
        if (record) {
            m_ByController.erase(&document);
            if (Find(record->m_Path) == record) {
                m_ByPath.erase(record->m_Path);
            }
        }
    }
    m_Changed.notify_all();
}

DocumentRegistry::Document DocumentRegistry::FindInFront(String const & path) const
{
    std::lock_guard const lock(m_Lock);
    RecordPointer const record = Find(Key(path));
    return record && record->m_State == State::Open && record->m_InFront ? record->m_Controller : nullptr;
}

DocumentRegistry::Document DocumentRegistry::FindMutable(DocumentController const & document) const
{
    std::lock_guard const lock(m_Lock);
    RecordPointer const record = Find(document);
    return record ? record->m_Controller : nullptr;
}

bool DocumentRegistry::IsInFront(DocumentController const & document) const
{
    std::lock_guard const lock(m_Lock);
    RecordPointer const record = Find(document);
    return record && record->m_State == State::Open && record->m_InFront;
}

bool DocumentRegistry::IsInFrontOnly(DocumentController const & document) const
{
    std::lock_guard const lock(m_Lock);
    RecordPointer const record = Find(document);
    return record && record->m_State == State::Open && record->m_InFront && record->m_Uses == 0;
}

bool DocumentRegistry::IsInBackgroundOnly(DocumentController const & document) const
{
    std::lock_guard const lock(m_Lock);
    RecordPointer const record = Find(document);
    return record && !record->m_InFront;
}

void DocumentRegistry::List(DocumentController const & document)
{
    std::lock_guard const lock(m_Lock);
    if (RecordPointer const record = Find(document)) {
        record->m_Listed = true;
    }
}

std::vector<Kernel::Counted<DocumentController const>> DocumentRegistry::GetListed() const
{
    std::vector<std::pair<std::uint64_t, Document>> found;
    {
        std::lock_guard const lock(m_Lock);
        for (auto const & [controller, record] : m_ByController) {
            if (record->m_State == State::Open && record->m_Listed) {
                found.emplace_back(record->m_Order, record->m_Controller);
            }
        }
    }
    std::sort(found.begin(), found.end(), [](auto const & a, auto const & b) { return a.first < b.first; });
    std::vector<Kernel::Counted<DocumentController const>> documents;
    for (auto & [order, document] : found) {
        documents.emplace_back(std::move(document));
    }
    return documents;
}

bool DocumentRegistry::Move(DocumentController const & document, String const & path)
{
    {
        std::lock_guard const lock(m_Lock);
        RecordPointer const record = Find(document);
        RecordPointer const taken = Find(Key(path));
        if (!record || (taken && taken != record)) {
            return false;
        }
        if (!record->m_Path.empty()) {
            m_ByPath.erase(record->m_Path);
        }
        record->m_Path = Key(path);
        m_ByPath[record->m_Path] = record;
    }
    m_Changed.notify_all();
    return true;
}

bool DocumentRegistry::Reserve(DocumentController const & document, String const & path)
{
    std::lock_guard const lock(m_Lock);
    RecordPointer const record = Find(document);
    RecordPointer const taken = Find(Key(path));
    if (taken && taken != record) {
        return false;
    }
    if (record) {
        m_ByPath[Key(path)] = record;
    }
    return true;
}

void DocumentRegistry::Release(DocumentController const & document, String const & path)
{
    {
        std::lock_guard const lock(m_Lock);
        RecordPointer const record = Find(document);
        if (record && record->m_Path != Key(path) && Find(Key(path)) == record) {
            m_ByPath.erase(Key(path));
        }
    }
    m_Changed.notify_all();
}
