#include <storage/local/HeldFolder.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/detail/FileDescriptor.hpp>

#include <string>
#include <utility>

namespace foundation::storage::local {

HeldFolder::HeldFolder(detail::FileDescriptor folder)
    : folder_(std::make_shared<detail::FileDescriptor const>(std::move(folder)))
{}

provider::StorageIRI HeldFolder::location() const
{
    std::string const path = "file:///proc/self/fd/" + std::to_string(folder_->get()) + "/.";
    return provider::StorageIRI(std::u16string(path.begin(), path.end()));
}

} // namespace foundation::storage::local
