#include "framework/kernel/TurnSession.h"

#include "framework/kernel/Assert.h"

#include <algorithm>
#include <utility>

namespace Kernel
{

namespace
{

thread_local TurnSession * innermostSession = nullptr;

}

TurnSession::TurnSession() : m_Outer(std::exchange(innermostSession, this)) {}

TurnSession::~TurnSession()
{
    KORVANE_ASSERT_MESSAGE(innermostSession == this, "sessions nest on one thread");
    innermostSession = m_Outer;
}

void TurnSession::Keep(Counted<Countable const> object)
{
    if (!object) {
        return;
    }
    KORVANE_ASSERT_MESSAGE(innermostSession, "a reference into a snapshot is handed out on a thread without a session");
    // A loop over a getter hands in the same snapshot again and again.
    std::vector<Counted<Countable const>> & kept = innermostSession->m_Kept;
    std::size_t const recent = std::min<std::size_t>(kept.size(), 8);
    if (std::find(kept.end() - static_cast<std::ptrdiff_t>(recent), kept.end(), object) == kept.end()) {
        kept.push_back(std::move(object));
    }
}

bool TurnSession::IsOpen()
{
    return innermostSession != nullptr;
}

}
