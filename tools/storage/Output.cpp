#include <tools/storage/Output.hpp>

#include <tools/storage/interrupt.hpp>

#include <cerrno>
#include <unistd.h>

namespace foundation::storage::tool {

namespace {

constexpr std::size_t bufferSize = std::size_t{64} << 10U;

void writeAll(std::string_view bytes)
{
    while (!bytes.empty()) {
        waitForOutput(STDOUT_FILENO);
        ssize_t const written = ::write(STDOUT_FILENO, bytes.data(), bytes.size());
        if (written >= 0)
            bytes.remove_prefix(static_cast<std::size_t>(written));
        else if (errno != EINTR)
            throw OutputFailure{errno};
    }
}

} // namespace

Output::Output() : isTerminal_(::isatty(STDOUT_FILENO) == 1) {}

void Output::write(std::string_view bytes)
{
    if (buffer_.size() + bytes.size() > bufferSize)
        flush();
    if (bytes.size() > bufferSize)
        writeAll(bytes);
    else
        buffer_.append(bytes);
}

void Output::endLine(char terminator)
{
    write({&terminator, 1});
    if (isTerminal_)
        flush();
}

void Output::flush()
{
    std::string const bytes = std::move(buffer_);
    buffer_.clear();
    writeAll(bytes);
}

} // namespace foundation::storage::tool
