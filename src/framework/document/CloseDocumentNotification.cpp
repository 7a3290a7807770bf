#include "framework/document/CloseDocumentNotification.h"

#include "framework/document/DocumentController.h"
#include "framework/kernel/BroadcastNotification.h"

#include <utility>

CloseDocumentNotification::CloseDocumentNotification(Kernel::Counted<DocumentController const> document)
    : DocumentNotification(std::move(document))
{
    TellWhenPassed();
}

void CloseDocumentNotification::AddCallback(std::function<void(String const &)> callback)
{
    Kernel::ScopedLock const lock(m_Lock);
    m_Callbacks.push_back({BroadcastNotification::CurrentLine(), std::move(callback)});
}

void CloseDocumentNotification::Closed(String const & path)
{
    {
        Kernel::ScopedLock const lock(m_Lock);
        m_Closed = true;
        m_Path = path;
    }
    RunCallbacksIfOver();
}

void CloseDocumentNotification::OnPassedEveryLine()
{
    {
        Kernel::ScopedLock const lock(m_Lock);
        m_Passed = true;
    }
    RunCallbacksIfOver();
}

void CloseDocumentNotification::RunCallbacksIfOver()
{
    std::vector<Callback> callbacks;
    String path;
    {
        Kernel::ScopedLock const lock(m_Lock);
        if (!m_Closed || !m_Passed) {
            return;
        }
        callbacks.swap(m_Callbacks);
        path = m_Path;
    }
    for (Callback & callback : callbacks) {
        BroadcastNotification::RunOnLine(callback.m_Line, [run = std::move(callback.m_Function), path] { run(path); });
    }
}
