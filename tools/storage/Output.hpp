#pragma once

#include <string>
#include <string_view>

namespace foundation::storage::tool {

/// Standard output could not be written; `error` is the `errno`. Not a `std::exception`: it ends the command.
struct OutputFailure
{
    int error;
};

/// Standard output: buffered, every byte as it is given, every failure noticed.
///
/// What is not flushed when the object goes is lost, so that a failure is never swallowed.
class Output
{
public:
    Output();

    bool isTerminal() const { return isTerminal_; }

    /// Throws `OutputFailure`, and `Interrupted` while nobody takes what is written; as does `flush`.
    void write(std::string_view bytes);

    /// Ends a line, which a terminal shows at once.
    void endLine(char terminator = '\n');
    void flush();

private:
    std::string buffer_;
    bool isTerminal_;
};

} // namespace foundation::storage::tool
