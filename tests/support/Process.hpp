#pragma once

#include <filesystem>
#include <functional>
#include <string>
#include <sys/types.h>
#include <vector>

namespace foundation::tests::support {

/// What a program wrote, and how it ended.
struct ProgramResult
{
    std::string output;
    std::string errors;
    int status; ///< its exit status, or 128 and the number of the signal that ended it
};

/// How a program is started.
struct ProcessOptions
{
    std::filesystem::path workingFolder = {};

    /// A file that is standard input; otherwise that is the one of the test.
    std::filesystem::path input = {};

    /// A file that is standard output; otherwise what comes out is collected.
    std::filesystem::path output = {};

    /// Whether standard output and standard error are a terminal. What comes out of either is then `output`.
    bool onTerminal = false;

    /// Called in the new process before the program is; it may call the system, and nothing else.
    std::function<void()> prepare = {};
};

/// A program that runs. What it writes is collected by `finish`; without that the program is killed in the end.
///
/// Arguments are bytes, the environment is that of the test.
class Process
{
public:
    explicit Process(std::vector<std::string> const& command, ProcessOptions const& options = {});
    ~Process();
    Process(Process const&) = delete;
    Process& operator=(Process const&) = delete;

    /// Its number, while it runs.
    pid_t id() const { return process_; }

    void send(int signal) const;

    /// Whether it has not ended yet.
    bool isRunning() const;

    ProgramResult finish();

private:
    void start(std::vector<std::string> const& command, ProcessOptions const& options, int output, int errors);

    pid_t process_ = -1;
    int output_ = -1;
    int errors_ = -1;
};

/// Runs a program to its end.
ProgramResult runProgram(std::vector<std::string> const& command, ProcessOptions const& options = {});

} // namespace foundation::tests::support
