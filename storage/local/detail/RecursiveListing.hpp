#pragma once

#include <storage/local/detail/EntryMaker.hpp>
#include <storage/local/detail/FolderChain.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/Selection.hpp>
#include <storage/provider/IFolderEntryIterator.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <memory>
#include <optional>
#include <string>

namespace foundation::storage::local::detail {

/// What is selected of all that lies below a folder, read as it is walked: each folder comes right before what it
/// holds. Names are paths from the folder that is listed.
///
/// Links are not followed into folders. Entries that vanish meanwhile are passed over. A folder that cannot be read
/// fails when its entries are due; `next` may then be called once more, and goes on behind it.
/// Cost: as `LocalListing`; memory grows with the depth alone.
class RecursiveListing final : public provider::IFolderEntryIterator
{
public:
    /// Throws `Exception` when the folder cannot be opened or read.
    RecursiveListing(std::shared_ptr<Root const> root, provider::StorageIRI const& folder, Selection selection);

    bool hasEntry() const override { return entry_.has_value(); }
    provider::FolderEntry const& entry() const override { return *entry_; }
    void next() override;
    void reset() override;

private:
    RecursiveListing(std::shared_ptr<FolderPath const> path, provider::StorageIRI const& folder, Selection selection);

    bool advance();
    void leave();
    void descend();
    void take(FoundName const& found);
    ListedFolder listedFolder() const;
    [[noreturn]] void throwAt(std::string const& path, int error) const;

    std::shared_ptr<FolderPath const> path_;
    provider::StorageIRI iri_;
    FolderChain chain_;
    EntryMaker maker_;
    std::optional<ListedFolder> folder_; ///< the innermost, once an entry of it is made
    std::string pending_;                ///< the folder to go into before anything more is read
    std::optional<provider::FolderEntry> entry_;
};

} // namespace foundation::storage::local::detail
