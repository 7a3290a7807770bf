#include "support/HeldQueue.h"

#include "commands/BookCommand.h"
#include "framework/kernel/Activity.h"
#include "framework/kernel/BroadcastNotification.h"
#include "framework/kernel/DomainWriterUnlockSession.h"
#include "framework/kernel/Semaphore.h"
#include "support/ClassName.h"

#include <thread>

using Kernel::Counted;

struct HeldQueue::State
{
    Kernel::Semaphore m_Held{0};
    Kernel::Semaphore m_Release{0};
    Kernel::Semaphore m_Ended{0};
    std::vector<std::string> m_Names;
};

namespace
{

constexpr std::string_view BookNamespace = "Book::";

/// Runs a function on the book's queue.
class TurnCommand final : public Book::BookCommand
{
public:
    explicit TurnCommand(std::function<void(Book::BookController &)> work) : m_Work(std::move(work)) {}
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override { return {"Turn", "Test command"}; }
    void Do() override { m_Work(*GetBookController()); }

private:
    std::function<void(Book::BookController &)> const m_Work;
};

}

HeldQueue::HeldQueue(Counted<Book::BookController> const & book) : m_State(std::make_shared<State>())
{
    auto const hold = Kernel::MakeCounted<TurnCommand>([state = m_State](Book::BookController & held) {
        {
            DomainWriterUnlockSession const unlocked{Counted<DomainController>(&held)};
            state->m_Held.Signal();
            state->m_Release.Wait(0);
        }
        std::vector<Counted<Kernel::Notification>> notifications;
        while (Counted<DomainCommand> const command = held.PreMergeAndDequeueCommand(notifications)) {
            std::string const name = ClassName(*command);
            state->m_Names.push_back(name.starts_with(BookNamespace) ? name.substr(BookNamespace.size()) : name);
            // It counts as under way from its enqueueing to its end, which it will not see.
            Kernel::Activity::End();
        }
        state->m_Ended.Signal();
    });
    book->DomainController::EnqueueCommand(hold);
    m_State->m_Held.Wait(0);
}

HeldQueue::~HeldQueue()
{
    if (m_Held) {
        static_cast<void>(Take());
    }
}

std::vector<std::string> HeldQueue::Take()
{
    std::uint64_t const posted = BroadcastNotification::LastPostingNumber();
    while (BroadcastNotification::DeliveredUpTo() < posted) {
        std::this_thread::yield();
    }
    m_Held = false;
    m_State->m_Release.Signal();
    m_State->m_Ended.Wait(0);
    return m_State->m_Names;
}
