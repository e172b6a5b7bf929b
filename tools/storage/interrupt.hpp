#pragma once

#include <csignal>
#include <string>

namespace foundation::storage::tool {

/// The user asked to stop. Not a `std::exception`, so that it passes whatever handles failures.
struct Interrupted
{
    int signal;
    std::string done = {};   ///< what was done until then, in words for the user; empty when there is nothing to say
    bool leavesWork = false; ///< a thread is still at work, which nobody can stop
};

/// Makes SIGINT, SIGTERM, SIGHUP and SIGQUIT requests to stop, which work looks for between two steps. The third one
/// ends the program at once, for when a step does not end. A signal that was ignored stays so.
void catchInterrupts();

/// Throws `Interrupted` when the user asked to stop.
void checkInterrupt();

/// Holds interrupts back from this thread, and for ever from the threads that it starts meanwhile, while it lives. They
/// go to the main thread, whose waits they end.
class HeldInterrupts
{
public:
    HeldInterrupts();
    ~HeldInterrupts();
    HeldInterrupts(HeldInterrupts const&) = delete;
    HeldInterrupts& operator=(HeldInterrupts const&) = delete;

    sigset_t const& maskBefore() const { return before_; }

private:
    sigset_t before_;
};

/// Waits until a descriptor can be read. Throws `Interrupted` at once when the signal comes, be it just before the
/// wait.
void waitForInput(int descriptor);

/// The same, also until `output` is a pipe whose reader has gone. Answers whether it is not.
bool waitForInputWhileRead(int descriptor, int output);

/// Waits until a descriptor can be written. Throws `Interrupted` only if that takes waiting, so that what was done
/// before an interrupt can be told.
void waitForOutput(int descriptor);

} // namespace foundation::storage::tool
