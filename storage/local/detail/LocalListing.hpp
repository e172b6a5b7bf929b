#pragma once

#include <storage/local/detail/EntryMaker.hpp>
#include <storage/local/detail/FolderReader.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/Selection.hpp>
#include <storage/provider/IFolderEntryIterator.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <memory>
#include <optional>

namespace foundation::storage::local::detail {

/// What is selected of a folder, in the order of the file system, read as it is walked (see `FolderReader` and
/// `EntryMaker`).
///
/// Entries that vanish between their name being read and their attributes being asked for are passed over.
class LocalListing final : public provider::IFolderEntryIterator
{
public:
    /// Throws `Exception` when the folder cannot be opened or read.
    LocalListing(std::shared_ptr<Root const> root, provider::StorageIRI const& folder, Selection selection);

    bool hasEntry() const override { return entry_.has_value(); }
    provider::FolderEntry const& entry() const override { return *entry_; }
    void next() override;
    void reset() override;

private:
    LocalListing(std::shared_ptr<FolderPath const> path, provider::StorageIRI const& folder, Selection selection);
    [[noreturn]] void throwAt(FoundName const& found, int error) const;

    provider::StorageIRI iri_;
    FolderReader reader_;
    ListedFolder folder_;
    EntryMaker maker_;
    std::optional<provider::FolderEntry> entry_;
};

} // namespace foundation::storage::local::detail
