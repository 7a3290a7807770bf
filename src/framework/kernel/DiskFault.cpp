#include "framework/kernel/DiskFault.h"

#include <atomic>
#include <cerrno>

namespace Kernel
{

namespace
{

std::atomic<DiskFault::Handler const *> s_Handler{nullptr};

}

int DiskFault::Ask(DiskOperation operation, char const * path)
{
    Handler const * const handler = s_Handler.load(std::memory_order_acquire);
    if (!handler) {
        return 0;
    }
    int const error = (*handler)(operation, String(path));
    if (error != 0) {
        errno = error;
    }
    return error;
}

void DiskFault::SetHandler(Handler handler)
{
    Handler const * const next = handler ? new Handler(std::move(handler)) : nullptr;
    delete s_Handler.exchange(next, std::memory_order_acq_rel);
}

struct DiskFaultFromNth::State
{
    std::atomic<int> m_Seen{0};
};

DiskFaultFromNth::DiskFaultFromNth(DiskOperation operation, int nth, int errorNumber)
    : m_State(std::make_shared<State>())
{
    DiskFault::SetHandler([state = m_State, operation, nth, errorNumber](DiskOperation asked, String const &) {
        return asked == operation && nth <= ++state->m_Seen ? errorNumber : 0;
    });
}

DiskFaultFromNth::~DiskFaultFromNth()
{
    DiskFault::SetHandler(nullptr);
}

int DiskFaultFromNth::Seen() const
{
    return m_State->m_Seen.load();
}

}
