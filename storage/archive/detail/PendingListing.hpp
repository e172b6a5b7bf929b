#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/ArchiveListing.hpp>
#include <storage/archive/detail/PendingTree.hpp>

#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

namespace foundation::storage::archive::detail {

/// A folder of a tree with changes, as `ArchiveListing` gives one without; the tree may change meanwhile.
///
/// What is there all the time is listed once. What comes later is not listed, what goes before its turn may be.
class FOUNDATION_API PendingListing final : public provider::IFolderEntryIterator
{
public:
    /// `mutex` guards the tree; the caller holds it, and nobody after that.
    PendingListing(std::shared_ptr<PendingTree const> tree, std::shared_ptr<std::mutex> mutex, Index::Id folder,
                   Selection selection);

    bool hasEntry() const override { return entry_.has_value(); }
    provider::FolderEntry const& entry() const override { return *entry_; }
    void next() override;
    void reset() override;

private:
    /// A folder on the way, and how far it has been listed.
    struct Level
    {
        Index::Id folder;
        std::vector<Index::Id> entries;
        std::size_t next = 0;
    };

    void start();
    void findNext();
    std::optional<Index::Id> advance();
    void enter(Index::Id folder);
    std::optional<provider::FolderEntry> makeEntry(Index::Id id) const;

    std::shared_ptr<PendingTree const> tree_;
    std::shared_ptr<std::mutex> mutex_;
    Index::Id const folder_;
    Selection const selection_;
    std::optional<fl::filesystem::Wildcards> const pattern_;
    std::vector<Level> way_;
    std::u16string path_;
    std::optional<provider::FolderEntry> entry_;
};

} // namespace foundation::storage::archive::detail
