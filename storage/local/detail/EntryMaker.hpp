#pragma once

#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/FolderReader.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/Selection.hpp>
#include <storage/local/detail/attributes.hpp>
#include <storage/provider/FolderEntry.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <memory>
#include <optional>
#include <string>
#include <utility>

namespace foundation::storage::local::detail {

/// A folder of which entries are listed: open, where its path leads, and what stands before the names of its entries,
/// where the listing began above it.
struct ListedFolder
{
    int descriptor;
    std::shared_ptr<FolderPath const> path;
    std::u16string prefix = {};
};

/// Where the folder is that is to be listed; throws what `Root::pathOf` throws.
std::shared_ptr<FolderPath const> listedPath(std::shared_ptr<Root const> root, provider::StorageIRI const& folder);

/// Opens the folder that is to be listed; throws `Exception` with its location.
FileDescriptor openListed(FolderPath const& path, provider::StorageIRI const& folder);

/// Makes the entries of a listing of the names that are found in folders.
///
/// A link is what it leads to; one that leads nowhere is a file with the attributes of the link itself.
/// Cost: no call for a name that is not selected. For one that is, none without attributes and one with them; one more
/// for a link, and for each entry of a file system that does not tell the type.
class EntryMaker
{
public:
    explicit EntryMaker(Selection selection) : selection_(std::move(selection)) {}

    /// Puts the entry of a name that was found into `entry`, which is empty; nothing where it is not selected, or is
    /// there no more. Answers 0 or `errno`.
    [[nodiscard]] int make(ListedFolder const& folder, FoundName const& found,
                           std::optional<provider::FolderEntry>& entry) const;

private:
    int makeWithAttributes(ListedFolder const& folder, FoundName const& found, std::u16string&& name,
                           std::optional<provider::FolderEntry>& entry) const;

    Selection selection_;
};

} // namespace foundation::storage::local::detail
