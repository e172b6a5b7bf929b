#include <storage/local/detail/attributes.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/detail/errorCode.hpp>

#include <array>
#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <unistd.h>
#include <utility>

namespace foundation::storage::local::detail {

using provider::StorageIRI;

namespace {

namespace posix_time = boost::posix_time;

bool meansUnwritable(int error)
{
    return meansMissing(error) || error == EACCES || error == EPERM || error == EROFS || error == ETXTBSY;
}

/// What cannot be found out is not taken for a "no".
bool isWritable(Root const& root, std::string const& path)
{
    int const error = root.checkAccess(path, W_OK);
    if (error != 0 && !meansUnwritable(error))
        throwError(error, StorageIRI(StorageIRI(u"file:///"), fl::filesystem::from_native_bytes(path)));
    return error == 0;
}

auto deferredWritability(std::shared_ptr<Root const> root, std::string path)
{
    return [root = std::move(root), path = std::move(path)] { return isWritable(*root, path); };
}

/// Writability of an entry with a name of ordinary length, which is kept within: a listing makes one of these for each
/// entry, and shares the folder among them.
class EntryWritability
{
public:
    static constexpr std::size_t longestName = 47;

    EntryWritability(std::shared_ptr<FolderPath const> folder, std::string_view name)
        : folder_(std::move(folder)), length_(static_cast<unsigned char>(name.size()))
    {
        name.copy(name_.data(), name.size());
    }

    bool operator()() const { return isWritable(*folder_->root, folder_->pathOf({name_.data(), length_})); }

private:
    std::shared_ptr<FolderPath const> folder_;
    std::array<char, longestName> name_;
    unsigned char length_;
};

std::function<bool()> deferredWritability(std::shared_ptr<FolderPath const> folder, std::string_view name)
{
    if (name.size() <= EntryWritability::longestName)
        return EntryWritability(std::move(folder), name);
    return deferredWritability(folder->root, folder->pathOf(name));
}

} // namespace

std::string FolderPath::pathOf(std::string_view name) const
{
    std::string result = path;
    result += '/';
    return result += name;
}

posix_time::ptime toPtime(struct statx_timestamp const& time)
{
    static posix_time::ptime const epoch(boost::gregorian::date(1970, 1, 1));
    static posix_time::ptime const earliest(boost::date_time::min_date_time);
    static posix_time::ptime const latest(boost::date_time::max_date_time);
    static std::int64_t const earliestSecond = (earliest - epoch).total_seconds();
    static std::int64_t const latestSecond = (latest - epoch).total_seconds();
    if (time.tv_sec < earliestSecond)
        return earliest;
    if (time.tv_sec > latestSecond)
        return latest;
    return epoch + posix_time::seconds(time.tv_sec) + posix_time::microseconds(time.tv_nsec / 1000);
}

timespec toTimespec(posix_time::ptime const& time)
{
    static posix_time::ptime const epoch(boost::gregorian::date(1970, 1, 1));
    constexpr std::int64_t second = 1'000'000;
    std::int64_t const microseconds = (time - epoch).total_microseconds();
    std::int64_t const fraction = (microseconds % second + second) % second; // also of times before 1970
    return {.tv_sec = (microseconds - fraction) / second, .tv_nsec = fraction * 1000};
}

provider::FileAttributes toFileAttributes(Status const& status, std::shared_ptr<Root const> root, std::string path)
{
    return provider::FileAttributes(status.stx_size, toPtime(status.stx_mtime),
                                    deferredWritability(std::move(root), std::move(path)));
}

provider::FolderAttributes toFolderAttributes(Status const& status, std::shared_ptr<Root const> root, std::string path)
{
    return provider::FolderAttributes(toPtime(status.stx_mtime), deferredWritability(std::move(root), std::move(path)));
}

provider::FileAttributes toFileAttributes(Status const& status, std::shared_ptr<FolderPath const> folder,
                                          std::string_view name)
{
    return provider::FileAttributes(status.stx_size, toPtime(status.stx_mtime),
                                    deferredWritability(std::move(folder), name));
}

provider::FolderAttributes toFolderAttributes(Status const& status, std::shared_ptr<FolderPath const> folder,
                                              std::string_view name)
{
    return provider::FolderAttributes(toPtime(status.stx_mtime), deferredWritability(std::move(folder), name));
}

} // namespace foundation::storage::local::detail
