#include <tools/storage/standardInput.hpp>

#include <tools/storage/Failure.hpp>
#include <tools/storage/interrupt.hpp>

#include <cerrno>
#include <system_error>
#include <unistd.h>

namespace foundation::storage::tool {

std::string_view readStandardInput(std::vector<char>& buffer)
{
    for (;;) {
        waitForInput(STDIN_FILENO);
        ssize_t const count = ::read(STDIN_FILENO, buffer.data(), buffer.size());
        if (count >= 0)
            return {buffer.data(), static_cast<std::size_t>(count)};
        // Somebody else may have taken what there was.
        if (errno != EINTR && errno != EAGAIN)
            throw Failure{"standard input", std::generic_category().message(errno)};
    }
}

} // namespace foundation::storage::tool
