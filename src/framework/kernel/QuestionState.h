#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/Question.h"
#include "framework/kernel/ThreadSafety.h"

#include <functional>

namespace Kernel
{

/// The question itself, apart from its copies. Its domain knows it too, without keeping it.
class Question::State
{
public:
    State(Counted<DomainController> controller, std::function<void()> nothing);

    /// False if it has been answered before. Null answers with nothing.
    bool Answer(std::function<void()> answer);
    void MarkAsked();
    [[nodiscard]] bool IsAnswered() const;

private:
    CriticalSection m_Lock;
    bool m_Answered KORVANE_GUARDED_BY(m_Lock) = false;
    bool m_Asked KORVANE_GUARDED_BY(m_Lock) = false;
    Counted<DomainController> m_Controller KORVANE_GUARDED_BY(m_Lock);
    std::function<void()> m_Nothing KORVANE_GUARDED_BY(m_Lock);
};

}
