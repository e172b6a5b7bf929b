#include <storage/provider/FolderAttributes.hpp>

#include <storage/provider/detail/Lazy.hpp>

namespace foundation::storage::provider {

FolderAttributes::FolderAttributes(boost::posix_time::ptime const& lastModified, bool writable)
    : lastModified_(lastModified), writable_(detail::Lazy<bool>(writable))
{}

FolderAttributes::FolderAttributes(boost::posix_time::ptime const& lastModified, std::function<bool()> writable)
    : lastModified_(lastModified), writable_(detail::Lazy<bool>(std::move(writable)))
{}

} // namespace foundation::storage::provider
