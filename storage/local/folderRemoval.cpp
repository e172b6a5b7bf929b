#include <storage/local/folderRemoval.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/TreeRemoval.hpp>
#include <storage/local/detail/errorCode.hpp>

namespace foundation::storage::local {

std::vector<StayingEntry> removeFolderAsFarAsPossible(provider::StorageIRI const& folder)
{
    std::vector<StayingEntry> staying;
    for (detail::RemovalFailure const& failure : detail::removeTree(detail::Root(), folder, detail::Failures::All))
        staying.push_back({fl::filesystem::from_native_bytes(failure.path), detail::toErrorCode(failure.error)});
    return staying;
}

} // namespace foundation::storage::local
