#pragma once

#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/provider/IFolderEntryIterator.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <cstddef>
#include <memory>
#include <optional>
#include <string>

namespace foundation::storage::local::detail {

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

/// A folder, read from one descriptor a buffer at a time, in the order of the file system.
///
/// A link is what it leads to; one that leads nowhere is a file with the attributes of the link itself. Entries that
/// vanish between their name being read and their attributes being asked for are passed over.
/// Cost: names only, one call per buffer, and one more for each link (and for each entry of a file system that does not
/// tell the type); with attributes, one more for each entry.
class LocalListing final : public provider::IFolderEntryIterator
{
public:
    /// Throws `Exception` when the folder cannot be opened or read.
    LocalListing(std::shared_ptr<Root const> root, provider::StorageIRI const& folder, Entries entries, Detail detail);

    bool hasEntry() const override { return entry_.has_value(); }
    provider::FolderEntry const& entry() const override { return *entry_; }
    void next() override;
    void reset() override;

private:
    struct NameAndType;

    bool refill();
    bool accept(NameAndType const& found);
    bool acceptName(NameAndType const& found);
    bool acceptAttributes(char const* name);
    bool isFolderEntry(NameAndType const& found) const;
    int getTargetStatus(char const* name, Status& status) const;
    bool isWanted(bool folder) const;
    [[noreturn]] void throwAt(char const* name, int error) const;

    std::shared_ptr<Root const> root_;
    provider::StorageIRI folder_;
    std::string path_;
    Entries entries_;
    Detail detail_;
    FileDescriptor descriptor_;
    std::unique_ptr<char[]> buffer_;
    std::size_t position_ = 0;
    std::size_t end_ = 0;
    std::optional<provider::FolderEntry> entry_;
};

} // namespace foundation::storage::local::detail
