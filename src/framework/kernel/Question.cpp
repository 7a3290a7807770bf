#include "framework/kernel/QuestionState.h"

#include "framework/kernel/Activity.h"
#include "framework/kernel/DomainController.h"
#include "framework/kernel/DomainQueue.h"
#include "framework/kernel/Scheduler.h"

#include <utility>

namespace Kernel
{

namespace
{

/// An answer, as a turn of the queue of the domain that was asked about.
class AnswerCommand final : public DomainCommand
{
public:
    explicit AnswerCommand(std::function<void()> answer) : m_Answer(std::move(answer)) {}

    LocalisedString GetDescription() const override { return {}; }
    void Do() override { m_Answer(); }
    void Undo() override {}
    void Notify(std::vector<Counted<Notification>> &) override {}
    Counted<DomainController const> GetDomainController() const override { return m_Controller.Get(); }
    Counted<DomainController> GetDomainController() override { return m_Controller.Get(); }
    void PostDequeueWithMutableDomainController(NonCounted<DomainController> controller) override
    {
        m_Controller = controller;
    }
    bool ShouldStackForUndo() const override { return false; }
    bool ClearsPreviewCommands() const override { return false; }

private:
    std::function<void()> const m_Answer;
    NonCounted<DomainController> m_Controller;
};

void RunOnPool(std::function<void()> function)
{
    Activity::Begin();
    Scheduler::Run([run = std::move(function)] {
        run();
        Activity::End();
    });
}

}

Question::State::State(Counted<DomainController> controller, std::function<void()> nothing)
    : m_Controller(std::move(controller)), m_Nothing(std::move(nothing))
{
}

bool Question::State::Answer(std::function<void()> answer)
{
    Counted<DomainController> controller;
    std::function<void()> nothing;
    {
        ScopedLock const lock(m_Lock);
        if (std::exchange(m_Answered, true)) {
            return false;
        }
        controller.Swap(m_Controller);
        nothing.swap(m_Nothing);
        if (m_Asked) {
            Activity::EndQuestion();
        }
    }
    std::function<void()> run = answer ? std::move(answer) : std::move(nothing);
    if (!run) {
        return true;
    }
    if (!controller) {
        RunOnPool(std::move(run));
    } else if (!controller->EnqueueCommand(MakeCounted<AnswerCommand>(run))) {
        // Its queue runs empty, but the domain is still there.
        RunOnPool([controller, run] {
            controller->AcquireWriterLock();
            run();
            controller->ReleaseWriterLock();
        });
    }
    return true;
}

void Question::State::MarkAsked()
{
    ScopedLock const lock(m_Lock);
    if (!m_Answered && !std::exchange(m_Asked, true)) {
        Activity::BeginQuestion();
    }
}

bool Question::State::IsAnswered() const
{
    ScopedLock const lock(m_Lock);
    return m_Answered;
}

/// What the copies of a question share: the last of them answers with nothing.
struct Question::Handle
{
    explicit Handle(std::shared_ptr<State> state) : m_State(std::move(state)) {}
    ~Handle() { m_State->Answer(nullptr); }
    Handle(Handle const &) = delete;
    Handle & operator=(Handle const &) = delete;

    std::shared_ptr<State> const m_State;
};

Question::Question(Counted<DomainController> controller, std::function<void()> nothing)
{
    auto const state = std::make_shared<State>(controller, std::move(nothing));
    m_Handle = std::make_shared<Handle const>(state);
    if (controller && !controller->m_Queue->AddQuestion(state)) {
        state->Answer(nullptr);
    }
}

void Question::EndWith(Counted<DomainController> const & other) const
{
    if (!other->m_Queue->AddQuestion(m_Handle->m_State)) {
        m_Handle->m_State->Answer(nullptr);
    }
}

bool Question::Answer(std::function<void()> answer) const
{
    return m_Handle->m_State->Answer(std::move(answer));
}

bool Question::IsAnswered() const
{
    return m_Handle->m_State->IsAnswered();
}

void Question::MarkAsked() const
{
    m_Handle->m_State->MarkAsked();
}

}
