#pragma once

#include "framework/kernel/BroadcastNotification.h"
#include "framework/kernel/DomainController.h"

#include <functional>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

/// A domain with nothing of its own, whose writer lock guards a list of words.
class TestDomain : public DomainController
{
public:
    std::vector<std::string> m_Words;
};

/// A command that runs a function on its domain.
class TestCommand : public DomainCommand
{
public:
    explicit TestCommand(std::function<void(TestDomain &)> work) : m_Work(std::move(work)) {}

    Kernel::LocalisedString GetDescription() const override { return {"Test", "Test command"}; }
    void Do() override { m_Work(static_cast<TestDomain &>(*m_Controller)); }
    void Undo() override {}
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override
    {
        notifications.insert(notifications.end(), m_Says.begin(), m_Says.end());
    }
    Kernel::Counted<DomainController const> GetDomainController() const override { return m_Controller.Get(); }
    Kernel::Counted<DomainController> GetDomainController() override { return m_Controller.Get(); }
    void PostDequeueWithMutableDomainController(Kernel::NonCounted<DomainController> controller) override
    {
        m_Controller = controller;
    }

    std::vector<Kernel::Counted<Kernel::Notification>> m_Says;

protected:
    std::function<void(TestDomain &)> m_Work;
    Kernel::NonCounted<DomainController> m_Controller;
};

inline Kernel::Counted<TestCommand> Work(std::function<void(TestDomain &)> work)
{
    return Kernel::MakeCounted<TestCommand>(std::move(work));
}

/// A command that adds a word to the domain's list.
inline Kernel::Counted<TestCommand> Say(std::string word)
{
    return Work([word = std::move(word)](TestDomain & domain) { domain.m_Words.push_back(word); });
}

/// Says its name wherever it is met.
class TestNotification : public Kernel::Notification
{
public:
    explicit TestNotification(std::string name, int dedupeId = 0) : m_Name(std::move(name)), m_DedupeId(dedupeId) {}
    int GetDedupeId() const override { return m_DedupeId; }

    std::string const m_Name;
    int const m_DedupeId;
};

/// Writes down the names of all `TestNotification` in the order of delivery; it is registered for its own lifetime.
class RecordingSink : public BroadcastNotificationSink
{
public:
    explicit RecordingSink(std::function<void(TestNotification const &)> also = nullptr) : m_Also(std::move(also))
    {
        BroadcastNotification::RegisterBroadcastSink(this);
    }
    ~RecordingSink() override { BroadcastNotification::UnregisterBroadcastSink(this); }

    void Notify(Kernel::Counted<Kernel::Notification> notification) override
    {
        if (auto const * const test = dynamic_cast<TestNotification const *>(notification.Get())) {
            {
                std::lock_guard const lock(m_Lock);
                m_Names.push_back(test->m_Name);
            }
            if (m_Also) {
                m_Also(*test);
            }
        }
    }

    std::vector<std::string> Names()
    {
        std::lock_guard const lock(m_Lock);
        return m_Names;
    }

private:
    std::function<void(TestNotification const &)> const m_Also;
    std::mutex m_Lock;
    std::vector<std::string> m_Names;
};
