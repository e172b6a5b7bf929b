#include <tests/support/Process.hpp>

#include <array>
#include <cerrno>
#include <csignal>
#include <fcntl.h>
#include <poll.h>
#include <pty.h>
#include <sys/wait.h>
#include <system_error>
#include <unistd.h>
#include <utility>

namespace foundation::tests::support {

namespace {

constexpr int cannotStart = 127;

int require(int result, char const* attempt)
{
    if (result == -1)
        throw std::system_error(errno, std::generic_category(), attempt);
    return result;
}

/// Reading end, writing end.
std::array<int, 2> makePipe()
{
    std::array<int, 2> ends{};
    require(::pipe2(ends.data(), O_CLOEXEC), "pipe");
    return ends;
}

std::array<int, 2> makeTerminal()
{
    std::array<int, 2> ends{};
    winsize size{};
    size.ws_row = 24;
    size.ws_col = 80;
    require(::openpty(&ends[0], &ends[1], nullptr, nullptr, &size), "openpty");
    ::fcntl(ends[0], F_SETFD, FD_CLOEXEC);
    ::fcntl(ends[1], F_SETFD, FD_CLOEXEC);
    return ends;
}

/// Answers whether more may come. A terminal whose other side is closed fails with EIO.
bool readSome(int descriptor, std::string& text)
{
    std::array<char, 65536> buffer{};
    ssize_t const count = ::read(descriptor, buffer.data(), buffer.size());
    if (count > 0)
        text.append(buffer.data(), static_cast<std::size_t>(count));
    return count > 0 || (count == -1 && errno == EINTR);
}

/// Reads both to their ends, whichever has something, so that neither blocks the program.
void readBoth(int output, std::string& outputText, int errors, std::string& errorText)
{
    std::array<pollfd, 2> sources{pollfd{output, POLLIN, 0}, pollfd{errors, POLLIN, 0}};
    while (sources[0].fd != -1 || sources[1].fd != -1) {
        if (::poll(sources.data(), sources.size(), -1) == -1)
            continue;
        if (sources[0].revents != 0 && !readSome(output, outputText))
            sources[0].fd = -1;
        if (sources[1].revents != 0 && !readSome(errors, errorText))
            sources[1].fd = -1;
    }
}

void closeAll(std::initializer_list<int> descriptors)
{
    for (int const descriptor : descriptors) {
        if (descriptor != -1)
            ::close(descriptor);
    }
}

} // namespace

Process::Process(std::vector<std::string> const& command, ProcessOptions const& options)
{
    if (options.onTerminal) {
        auto const [outside, inside] = makeTerminal();
        output_ = outside;
        start(command, options, inside, inside);
        ::close(inside);
        return;
    }
    auto const [outputEnd, output] = makePipe();
    auto const [errorEnd, errors] = makePipe();
    output_ = outputEnd;
    errors_ = errorEnd;
    start(command, options, output, errors);
    closeAll({output, errors});
}

void Process::start(std::vector<std::string> const& command, ProcessOptions const& options, int output, int errors)
{
    std::vector<char*> arguments;
    for (std::string const& argument : command)
        arguments.push_back(const_cast<char*>(argument.c_str()));
    arguments.push_back(nullptr);

    process_ = require(::fork(), "fork");
    if (process_ != 0)
        return;
    if (!options.output.empty())
        output = ::open(options.output.c_str(), O_WRONLY | O_CLOEXEC);
    int const input = options.input.empty() ? STDIN_FILENO : ::open(options.input.c_str(), O_RDONLY | O_CLOEXEC);
    bool const isReady = ::dup2(input, STDIN_FILENO) != -1 && ::dup2(output, STDOUT_FILENO) != -1 &&
                         ::dup2(errors, STDERR_FILENO) != -1 &&
                         (options.workingFolder.empty() || ::chdir(options.workingFolder.c_str()) == 0);
    if (options.prepare)
        options.prepare();
    if (isReady)
        ::execv(arguments.front(), arguments.data());
    ::_exit(cannotStart);
}

Process::~Process()
{
    if (process_ != -1) {
        ::kill(process_, SIGKILL);
        ::waitpid(process_, nullptr, 0);
    }
    closeAll({output_, errors_});
}

void Process::send(int signal) const
{
    require(::kill(process_, signal), "kill");
}

bool Process::isRunning() const
{
    siginfo_t info{};
    require(::waitid(P_PID, static_cast<id_t>(process_), &info, WEXITED | WNOHANG | WNOWAIT), "waitid");
    return info.si_pid == 0;
}

ProgramResult Process::finish()
{
    ProgramResult result{};
    readBoth(output_, result.output, errors_, result.errors);
    int status = 0;
    require(::waitpid(std::exchange(process_, -1), &status, 0), "waitpid");
    result.status = WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
    return result;
}

ProgramResult runProgram(std::vector<std::string> const& command, ProcessOptions const& options)
{
    return Process(command, options).finish();
}

} // namespace foundation::tests::support
