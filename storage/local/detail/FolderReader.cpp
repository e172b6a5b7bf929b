#include <storage/local/detail/FolderReader.hpp>

#include <storage/local/detail/SystemCalls.hpp>

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <utility>

namespace foundation::storage::local::detail {

namespace {

/// Hundreds of entries per call: beyond that a larger buffer gains nothing.
constexpr std::size_t bufferSize = 32 * 1024;

bool isSelfOrParent(char const* name)
{
    return name[0] == '.' && (name[1] == '\0' || (name[1] == '.' && name[2] == '\0'));
}

} // namespace

FolderReader::FolderReader(FileDescriptor folder)
    : folder_(std::move(folder)), buffer_(std::make_unique_for_overwrite<char[]>(bufferSize))
{}

int FolderReader::next(FoundName& found)
{
    for (;;) {
        if (position_ == end_) {
            int const error = refill();
            if (error != 0 || end_ == 0) {
                found = {};
                return error;
            }
        }
        char const* const record = buffer_.get() + position_;
        std::uint16_t length;
        std::memcpy(&length, record + offsetof(dirent64, d_reclen), sizeof length);
        position_ += length;
        char const* const name = record + offsetof(dirent64, d_name);
        if (!isSelfOrParent(name)) {
            found = {name, static_cast<unsigned char>(record[offsetof(dirent64, d_type)])};
            return 0;
        }
    }
}

int FolderReader::restart()
{
    position_ = end_ = 0;
    return systemCalls().lseek(folder_.get(), 0, SEEK_SET) == -1 ? errno : 0;
}

int FolderReader::refill()
{
    position_ = end_ = 0;
    ssize_t const size = retried([&] { return systemCalls().getdents64(folder_.get(), buffer_.get(), bufferSize); });
    if (size == -1)
        return errno == ENOENT ? 0 : errno;
    end_ = static_cast<std::size_t>(size);
    return 0;
}

} // namespace foundation::storage::local::detail
