#pragma once

#include <cstddef>
#include <cstdint>

namespace foundation::storage::archive::detail {

/// The content of one entry, read from its beginning to its end. Failures are `Fault`s.
class Content
{
public:
    Content() = default;
    Content(Content const&) = delete;
    Content& operator=(Content const&) = delete;
    virtual ~Content() = default;

    /// The next bytes; 0 at the end.
    virtual std::size_t read(char* buffer, std::size_t count) = 0;

    /// Goes to a place at once, where that takes no reading; answers whether it did.
    virtual bool seek(std::uint64_t position) = 0;

    /// Goes back to the beginning.
    virtual void restart() = 0;

    /// Called when as much was read as the entry is said to hold: throws when there is more, or when what was read does
    /// not match its checksum.
    virtual void finish() = 0;
};

} // namespace foundation::storage::archive::detail
