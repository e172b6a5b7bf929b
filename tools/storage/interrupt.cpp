#include <tools/storage/interrupt.hpp>

#include <array>
#include <atomic>
#include <cerrno>
#include <csignal>
#include <poll.h>

namespace foundation::storage::tool {

namespace {

constexpr int patience = 3;
constexpr int caughtSignals[]{SIGINT, SIGTERM, SIGHUP, SIGQUIT};

std::atomic<int> pendingSignal = 0;
std::atomic<int> signalCount = 0;
static_assert(std::atomic<int>::is_always_lock_free, "or handlers could not use it");

extern "C" void rememberSignal(int signal)
{
    pendingSignal = signal;
    if (++signalCount >= patience) {
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

bool isReady(int descriptor, short event)
{
    pollfd wanted{descriptor, event, 0};
    return ::poll(&wanted, 1, 0) == 1;
}

void waitFor(int descriptor, short event)
{
    HeldInterrupts const held;
    pollfd wanted{descriptor, event, 0};
    do
        checkInterrupt();
    while (::ppoll(&wanted, 1, nullptr, &held.maskBefore()) == -1 && errno == EINTR);
}

} // namespace

HeldInterrupts::HeldInterrupts()
{
    sigset_t held;
    sigemptyset(&held);
    for (int const signal : caughtSignals)
        sigaddset(&held, signal);
    pthread_sigmask(SIG_BLOCK, &held, &before_);
}

HeldInterrupts::~HeldInterrupts()
{
    pthread_sigmask(SIG_SETMASK, &before_, nullptr);
}

void catchInterrupts()
{
    for (int const signal : caughtSignals)
        catchInterrupt(signal);
}

void checkInterrupt()
{
    if (int const signal = pendingSignal; signal != 0)
        throw Interrupted{signal};
}

void waitForInput(int descriptor)
{
    waitFor(descriptor, POLLIN);
}

bool waitForInputWhileRead(int descriptor, int output)
{
    HeldInterrupts const held;
    std::array<pollfd, 2> wanted{pollfd{descriptor, POLLIN, 0}, pollfd{output, 0, 0}};
    do
        checkInterrupt();
    while (::ppoll(wanted.data(), wanted.size(), nullptr, &held.maskBefore()) == -1 && errno == EINTR);
    return (wanted[1].revents & POLLERR) == 0;
}

void waitForOutput(int descriptor)
{
    if (!isReady(descriptor, POLLOUT))
        waitFor(descriptor, POLLOUT);
}

} // namespace foundation::storage::tool
