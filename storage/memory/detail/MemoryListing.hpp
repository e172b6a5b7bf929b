#pragma once

#include <fl/filesystem/wildcards.hpp>
#include <foundation/export.hpp>
#include <storage/memory/detail/Tree.hpp>
#include <storage/provider/IFolderEntryIterator.hpp>

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace foundation::storage::memory::detail {

enum class Entries
{
    All,
    Files,
    Folders,
};

enum class Detail
{
    NamesOnly,
    Attributes,
};

enum class Depth
{
    OneFolder,
    AllBelow,
};

/// What a listing gives: an entry of the wanted kind whose own name matches the pattern, where there is one.
struct Selection
{
    Entries entries = Entries::All;
    Detail detail = Detail::Attributes;
    Depth depth = Depth::OneFolder;
    std::optional<fl::filesystem::Wildcards> pattern = {};
};

/// A folder, walked by name while others may change it.
///
/// What is there all the time is listed once, whatever else happens; what comes or goes meanwhile may be listed or not.
/// Below the folder, each subfolder comes right before what it holds, and names are paths from the folder that is
/// listed.
/// Cost: memory for one entry and for one place in each folder on the way to it.
class MemoryListing final : public provider::IFolderEntryIterator
{
public:
    /// Throws `ResourceNotFound` where no folder is.
    MemoryListing(std::shared_ptr<Tree const> tree, StorageIRI const& folder, Selection selection);

    bool hasEntry() const override { return entry_.has_value(); }
    provider::FolderEntry const& entry() const override { return *entry_; }
    void next() override;
    void reset() override;

private:
    /// A folder on the way, and how long the path is that leads to it.
    struct Level
    {
        Cursor cursor;
        std::size_t pathLength;
    };

    std::optional<FoundEntry> advance();
    void descend(FoundEntry const& found);
    bool isWanted(FoundEntry const& found) const;
    provider::FolderEntry makeEntry(std::u16string name, FoundEntry const& found) const;

    std::shared_ptr<Tree const> tree_;
    Selection selection_;
    std::vector<Level> levels_;
    std::u16string path_;
    std::optional<provider::FolderEntry> entry_;
};

} // namespace foundation::storage::memory::detail
