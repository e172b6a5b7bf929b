#include <tools/storage/Session.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/printable.hpp>

#include <CLI/App.hpp>
#include <CLI/Config.hpp>
#include <CLI/Formatter.hpp>
#include <algorithm>
#include <cerrno>
#include <csignal>
#include <fcntl.h>
#include <fmt/format.h>
#include <map>
#include <new>
#include <sstream>
#include <system_error>
#include <unistd.h>

using namespace foundation::storage::tool;

namespace {

/// A file opened later must not become standard output or standard error by getting the number of one that is closed.
void occupyStandardStreams()
{
    for (int const stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
        if (::fcntl(stream, F_GETFD) == -1 && errno == EBADF)
            ::open("/dev/null", stream == STDIN_FILENO ? O_WRONLY : O_RDONLY);
    }
}

/// As the other programs of a pipeline end whose reader has gone.
[[noreturn]] void endAsBrokenPipe()
{
    std::signal(SIGPIPE, SIG_DFL);
    std::raise(SIGPIPE);
    ::_exit(128 + SIGPIPE);
}

int reportOutputFailure(OutputFailure const& failure, std::string const& command)
{
    if (failure.error == EPIPE)
        endAsBrokenPipe();
    writeError(command, "standard output: " + std::generic_category().message(failure.error));
    return exitFailed;
}

/// Runs a piece of the tool, and says how it ended.
template <typename Work>
int finish(std::string const& command, Work const& work)
{
    try {
        return work();
    } catch (Failure const& failure) {
        writeError(command, printable(failure.location) + ": " + printable(failure.reason));
    } catch (Interrupted const& interrupted) {
        writeError(command, interrupted.done.empty() ? "interrupted" : "interrupted: " + interrupted.done);
        // Nothing that a thread still works with may be taken down.
        if (interrupted.leavesWork)
            ::_exit(128 + interrupted.signal);
        return 128 + interrupted.signal;
    } catch (OutputFailure const& failure) {
        return reportOutputFailure(failure, command);
    } catch (std::bad_alloc const&) {
        writeError(command, "out of memory");
    } catch (std::exception const& error) {
        writeError(command, printable(error.what()));
    }
    return exitFailed;
}

int runCommand(std::string const& name, Action const& action)
{
    return finish(name, [&] {
        Session session(name);
        try {
            action(session);
        } catch (Interrupted const&) {
            session.output().flush();
            throw;
        } catch (...) {
            // What was done up to here has been done.
            session.finishWork();
            session.output().flush();
            throw;
        }
        session.finishWork();
        session.output().flush();
        return session.status();
    });
}

int misuse(std::string const& command, std::string const& message)
{
    writeError(command, printable(message));
    writeError("", fmt::format("'storage {}{}--help' says more", command, command.empty() ? "" : " "));
    return exitMisused;
}

/// Help and version come as errors of the parser, too.
int reportParseError(CLI::App const& app, CLI::ParseError const& error, std::string const& command)
{
    if (error.get_exit_code() != 0)
        return misuse(command, unmarked(error.what()));
    return finish(command, [&] {
        std::ostringstream text;
        app.exit(error, text, text);
        Output output;
        output.write(text.str());
        output.flush();
        return exitFine;
    });
}

bool isCommand(std::string const& name)
{
    auto const list = commands();
    return std::any_of(list.begin(), list.end(), [&](Command const& command) { return command.name == name; });
}

/// "-name" would be read as "-n ame". Answers the option that was meant, or nothing.
std::string optionMeant(CLI::App const& parser, int count, char const* const* arguments)
{
    for (int i = 2; i < count && std::string_view(arguments[i]) != "--"; ++i) {
        std::string const argument = arguments[i];
        bool const isSuspect = argument.size() > 2 && argument[0] == '-' && argument[1] != '-';
        if (isSuspect && parser.get_option_no_throw('-' + argument.substr(0, argument.find('='))) != nullptr)
            return '-' + argument;
    }
    return {};
}

int run(int count, char const* const* arguments)
{
    CLI::App app("Files and folders, wherever they are: paths, and IRIs such as file:///tmp/a%20b.", "storage");
    app.set_version_flag("--version", "storage " FOUNDATION_STORAGE_VERSION, "Print the version and exit");
    app.require_subcommand(1);
    app.formatter(makeHelpFormatter());
    std::map<std::string, Action> actions;
    for (Command const& command : commands()) {
        CLI::App* const parser = app.add_subcommand(command.name, command.summary)->group("Commands");
        actions[command.name] = command.define(*parser);
    }

    std::string const first = count > 1 ? arguments[1] : "";
    std::string const name = isCommand(first) ? first : "";
    if (count == 1)
        return misuse("", "a command is missing");
    if (name.empty() && !first.starts_with('-'))
        return misuse("", fmt::format("no command is called '{}'", first));
    if (!name.empty()) {
        std::string const meant = optionMeant(*app.get_subcommand(name), count, arguments);
        if (!meant.empty())
            return misuse(name, fmt::format("{}: did you mean {}?", meant.substr(1), meant));
    }
    try {
        app.parse(markedArguments(count, arguments));
    } catch (CLI::RequiredError const& error) {
        return misuse(name, name.empty() ? fmt::format("a command is needed, and '{}' is none", first) : error.what());
    } catch (CLI::ParseError const& error) {
        return reportParseError(app, error, name);
    }
    return runCommand(name, actions.at(name));
}

} // namespace

int main(int argc, char** argv)
{
    occupyStandardStreams();
    std::signal(SIGPIPE, SIG_IGN);
    // A write beyond the limit for the size of a file is to fail, and to leave no scratch file, rather than end this.
    std::signal(SIGXFSZ, SIG_IGN);
    catchInterrupts();
    return finish("", [&] { return run(argc, argv); });
}
