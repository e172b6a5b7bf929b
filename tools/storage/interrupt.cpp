#include <tools/storage/interrupt.hpp>

#include <csignal>
#include <initializer_list>

namespace foundation::storage::tool {

namespace {

constexpr int patience = 3;

std::sig_atomic_t volatile pendingSignal = 0;
std::sig_atomic_t volatile signalCount = 0;

extern "C" void rememberSignal(int signal)
{
    pendingSignal = signal;
    signalCount = signalCount + 1;
    if (signalCount >= patience) {
        std::signal(signal, SIG_DFL);
        std::raise(signal);
    }
}

void catchInterrupt(int signal)
{
    struct sigaction action
    {};
    sigaction(signal, nullptr, &action);
    if (action.sa_handler == SIG_IGN)
        return;
    action = {};
    action.sa_handler = &rememberSignal;
    sigaction(signal, &action, nullptr);
}

} // namespace

void catchInterrupts()
{
    for (int const signal : {SIGINT, SIGTERM, SIGHUP})
        catchInterrupt(signal);
}

void checkInterrupt()
{
    if (int const signal = pendingSignal; signal != 0)
        throw Interrupted{signal};
}

} // namespace foundation::storage::tool
