#pragma once

#include "framework/document/DocumentNotification.h"
#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/StringT.h"
#include "framework/kernel/ThreadSafety.h"

#include <cstdint>
#include <functional>
#include <vector>

/// A document in front is closing. A sink may leave callbacks here while it is being notified: each runs on the sink's
/// own line, with the document's path, once the file is closed (or the document has gone back to its book) and every
/// line has passed this notification. Until then the tree stays readable, and runs no commands any more.
class CloseDocumentNotification : public DocumentNotification
{
public:
    explicit CloseDocumentNotification(Kernel::Counted<DocumentController const> document);

    void AddCallback(std::function<void(String const &)> callback);

    /// The close is over. Once, by whoever closes.
    void Closed(String const & path);

protected:
    void OnPassedEveryLine() override;

private:
    void RunCallbacksIfOver();

    struct Callback
    {
        std::uint64_t m_Line;
        std::function<void(String const &)> m_Function;
    };

    Kernel::CriticalSection m_Lock;
    std::vector<Callback> m_Callbacks KORVANE_GUARDED_BY(m_Lock);
    String m_Path KORVANE_GUARDED_BY(m_Lock);
    bool m_Closed KORVANE_GUARDED_BY(m_Lock) = false;
    bool m_Passed KORVANE_GUARDED_BY(m_Lock) = false;
};
