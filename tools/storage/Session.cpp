#include <tools/storage/Session.hpp>

#include <tools/storage/interrupt.hpp>
#include <tools/storage/printable.hpp>

#include <cerrno>
#include <fmt/format.h>
#include <unistd.h>

namespace foundation::storage::tool {

Session::Session(std::string command) : command_(std::move(command)) {}

void Session::printName(std::string_view bytes, char terminator)
{
    progress_.erase();
    output_.write(output_.isTerminal() ? printable(bytes) : std::string(bytes));
    output_.endLine(terminator);
}

/// It is in ASCII, and holds nothing that a terminal would obey.
void Session::printJSON(std::string_view object)
{
    progress_.erase();
    output_.write(object);
    output_.endLine();
}

void Session::complain(Failure const& failure)
{
    status_ = exitFailed;
    progress_.erase();
    output_.flush();
    writeError(command_, fmt::format("{}: {}", printable(failure.location), printable(failure.reason)));
}

void Session::finishWork()
{
    if (!stores_.hasArchives())
        return;
    checkInterrupt();
    attempt([&] { stores_.writeArchives(); });
    progress_.erase();
}

void writeError(std::string_view command, std::string_view text)
{
    std::string const line = fmt::format("storage: {}{}{}\n", command, command.empty() ? "" : ": ", text);
    std::string_view rest = line;
    while (!rest.empty()) {
        ssize_t const written = ::write(STDERR_FILENO, rest.data(), rest.size());
        if (written < 0 && errno != EINTR)
            return; // nobody is left to tell
        rest.remove_prefix(written < 0 ? 0 : static_cast<std::size_t>(written));
    }
}

} // namespace foundation::storage::tool
