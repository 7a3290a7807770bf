#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"

#include <condition_variable>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <unordered_map>
#include <vector>

class DocumentController;

/// What is known of each path: nobody has it, somebody loads it, it is open (in front, in the background, or both), or it
/// is closing. One lock, which is never held while anything else is called or waited for. Safe on any thread.
class DocumentRegistry
{
public:
    using Document = Kernel::Counted<DocumentController>;

    /// See `VantraController::RegisterLoadingController`. `beforeWaiting`, if there is one, is called at most once, before
    /// a wait for another loader.
    bool ClaimForLoading(String const & path, Document & controller, std::function<void()> const & beforeWaiting);
    /// Ends the claim: null for a load that failed, or the document, which is open from now on, in front or kept for the
    /// calling thread until its `AddUse`.
    void EndLoading(String const & path, Document controller, bool inFront);
    /// A document that was made in memory is open in front. False if its path is taken.
    bool AddInFront(Document controller);
    /// The user takes an open document in front. False if it was in front already, or is not open any more.
    bool TakeInFront(DocumentController const & document);

    void AddUse(DocumentController const & document);
    /// True if this was the last use of a document that is not in front: then it is closing from this moment on.
    bool EndUse(DocumentController const & document, bool & keepUnsaved);

    enum class Leaving
    {
        /// Nobody needs it any more: it is closing now.
        Closing,
        /// Books still use it: it has left the front.
        Demoted,
        /// It is closing already, by its last user's leaving.
        AlreadyClosing,
        /// It is not in front, and others use it; or it is not open.
        NotOurs
    };
    /// The user's side of a close. `discard` says that changes of a demoted document are not to be saved.
    Leaving Leave(DocumentController const & document, bool discard);
    /// The closing document's last turn waits in its queue: somebody who waits for the path may help it along.
    void LastTurnIsWaiting();
    /// The file is closed: the path is free.
    void Closed(DocumentController const & document);

    [[nodiscard]] Document FindInFront(String const & path) const;
    /// Loading or open.
    [[nodiscard]] Document FindMutable(DocumentController const & document) const;
    [[nodiscard]] bool IsInFront(DocumentController const & document) const;
    [[nodiscard]] bool IsInFrontOnly(DocumentController const & document) const;
    [[nodiscard]] bool IsInBackgroundOnly(DocumentController const & document) const;
    void List(DocumentController const & document);
    [[nodiscard]] std::vector<Kernel::Counted<DocumentController const>> GetListed() const;
    bool Move(DocumentController const & document, String const & path);
    /// A second path for an open document until it moves there or gives it up. True for one that is not open: nobody
    /// asks for that here.
    bool Reserve(DocumentController const & document, String const & path);
    void Release(DocumentController const & document, String const & path);

private:
    enum class State
    {
        Loading,
        Open,
        Closing
    };
    struct Record
    {
        std::string m_Path;
        Document m_Controller;
        State m_State = State::Loading;
        bool m_InFront = false;
        bool m_Listed = false;
        bool m_KeepUnsaved = false;
        int m_Uses = 0;
        /// Threads that were given the document and have not counted themselves in yet.
        std::vector<std::thread::id> m_Promised;
        std::thread::id m_Loader;
        /// Threads that wait for the load: they are promised the document, so that nobody has to load it again.
        std::vector<std::thread::id> m_Awaiting;
        std::uint64_t m_Order = 0;
    };
    using RecordPointer = std::shared_ptr<Record>;

    /// With the lock held. Null if there is none.
    [[nodiscard]] RecordPointer Find(DocumentController const & document) const;
    [[nodiscard]] RecordPointer Find(std::string const & path) const;
    void Enter(RecordPointer const & record);

    mutable std::mutex m_Lock;
    std::condition_variable m_Changed;
    std::map<std::string, RecordPointer> m_ByPath;
    std::unordered_map<DocumentController const *, RecordPointer> m_ByController;
    /// Uses of documents that had begun to close when they were counted in.
    std::unordered_map<DocumentController const *, int> m_LateUses;
    std::uint64_t m_LastOrder = 0;
};
