#pragma once

#include "framework/kernel/Counted.h"

#include <functional>
#include <memory>

class DomainController;

namespace Kernel
{

/// One question to the user, and the certainty that it is answered exactly once.
///
/// A notification that asks something holds one. The first answer counts. It runs as a turn of the queue of the domain
/// that the question names, under its writer lock; never on the thread that answers. A question answers itself with
/// nothing when its last copy goes (nobody listens, or the front end goes away) and when its domain closes. Safe on any
/// thread; copies are the same question.
class Question
{
public:
    /// \param controller whose turn the answer is; null: a thread of the pool runs it, under no lock
    /// \param nothing what answering with nothing does
    Question(Counted<DomainController> controller, std::function<void()> nothing);

    /// The question also answers itself with nothing when this other domain closes, for whose sake it is asked.
    void EndWith(Counted<DomainController> const & other) const;

    /// False if it has been answered before.
    bool Answer(std::function<void()> answer) const;
    [[nodiscard]] bool IsAnswered() const;

    /// The question has reached the front end: from now until the answer, the process counts as waiting for the user.
    void MarkAsked() const;

    /// What a domain keeps of the questions that name it.
    class State;

private:
    struct Handle;
    std::shared_ptr<Handle const> m_Handle;
};

}
