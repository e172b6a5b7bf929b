#pragma once

#include <chrono>
#include <cstdint>
#include <string>

namespace foundation::storage::tool {

/// One line on standard error that says how far a long piece of work is: shown after a second, erased before anything
/// else is written and at the end. Nothing at all where standard error is not a terminal.
class Progress
{
public:
    Progress();
    ~Progress();
    Progress(Progress const&) = delete;
    Progress& operator=(Progress const&) = delete;

    void addBytes(long count);
    void addFile();

    /// Makes room for other output on the terminal.
    void erase();

private:
    using Clock = std::chrono::steady_clock;

    void draw();
    std::string line(Clock::time_point now) const;

    bool const isShown_;
    bool isDrawn_ = false;
    Clock::time_point const start_ = Clock::now();
    Clock::time_point nextDraw_;
    std::uint64_t bytes_ = 0;
    std::uint64_t files_ = 0;
};

} // namespace foundation::storage::tool
