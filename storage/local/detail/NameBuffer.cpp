#include <storage/local/detail/NameBuffer.hpp>

#include <storage/local/detail/SystemCalls.hpp>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstring>

namespace foundation::storage::local::detail {

namespace {

/// Hundreds of entries per call: a larger buffer saves nothing that counts, and what the system has read of so many
/// more entries has left the caches before they are asked about.
constexpr std::size_t bufferSize = 16 * 1024;

bool isSelfOrParent(char const* name)
{
    return name[0] == '.' && (name[1] == '\0' || (name[1] == '.' && name[2] == '\0'));
}

template <typename Field>
Field fieldOf(char const* record, std::size_t offset)
{
    Field field;
    std::memcpy(&field, record + offset, sizeof field);
    return field;
}

} // namespace

NameBuffer::NameBuffer() : buffer_(std::make_unique_for_overwrite<char[]>(bufferSize)) {}

int NameBuffer::next(int folder, FoundName& found)
{
    for (;;) {
        if (position_ == end_) {
            int const error = refill(folder);
            if (error != 0 || end_ == 0) {
                found = {};
                return error;
            }
        }
        char const* const record = buffer_.get() + position_;
        position_ += fieldOf<std::uint16_t>(record, offsetof(dirent64, d_reclen));
        char const* const name = record + offsetof(dirent64, d_name);
        if (!isSelfOrParent(name)) {
            found = {name, fieldOf<unsigned char>(record, offsetof(dirent64, d_type)),
                     fieldOf<ino64_t>(record, offsetof(dirent64, d_ino)),
                     fieldOf<off64_t>(record, offsetof(dirent64, d_off))};
            return 0;
        }
    }
}

void NameBuffer::clear()
{
    position_ = end_ = 0;
}

std::vector<char> NameBuffer::takeRest()
{
    std::vector<char> rest(buffer_.get() + position_, buffer_.get() + end_);
    clear();
    return rest;
}

void NameBuffer::putRest(std::vector<char> const& rest)
{
    std::copy(rest.begin(), rest.end(), buffer_.get());
    position_ = 0;
    end_ = rest.size();
}

int NameBuffer::refill(int folder)
{
    clear();
    ssize_t const size = retried([&] { return systemCalls().getdents64(folder, buffer_.get(), bufferSize); });
    if (size == -1)
        return errno == ENOENT ? 0 : errno;
    end_ = static_cast<std::size_t>(size);
    return 0;
}

} // namespace foundation::storage::local::detail
