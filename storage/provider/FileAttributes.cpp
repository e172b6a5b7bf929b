#include <storage/provider/FileAttributes.hpp>

#include <storage/provider/detail/Lazy.hpp>

namespace foundation::storage::provider {

FileAttributes::FileAttributes(std::uint64_t size, boost::posix_time::ptime const& lastModified, bool writable)
    : size_(size), lastModified_(lastModified), writable_(detail::Lazy<bool>(writable))
{}

FileAttributes::FileAttributes(std::uint64_t size, boost::posix_time::ptime const& lastModified,
                               std::function<bool()> writable)
    : size_(size), lastModified_(lastModified), writable_(detail::Lazy<bool>(std::move(writable)))
{}

} // namespace foundation::storage::provider
