#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Archive.hpp>
#include <storage/provider/IFolderEntryIterator.hpp>

#include <fl/filesystem/wildcards.hpp>

#include <memory>
#include <optional>
#include <string>

namespace foundation::storage::archive::detail {

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

/// What a listing gives: an entry of the wanted kind whose own name matches the pattern, unless that is empty.
struct Selection
{
    Entries entries = Entries::All;
    Detail detail = Detail::Attributes;
    Depth depth = Depth::OneFolder;
    std::u16string pattern = {};
};

/// The attributes of an entry that is no link.
FOUNDATION_API provider::FileAttributes fileAttributes(Node const& node, bool isWritable);
FOUNDATION_API provider::FolderAttributes folderAttributes(Node const& node, bool isWritable);

/// A folder of an archive, in the order of the archive, which is the fastest to read it in.
///
/// A link is listed as what it leads to; one that leads nowhere is a file with the attributes of the link. Below the
/// folder, each subfolder comes right before what it holds, and names are paths from the folder that is listed; links
/// are not entered. Where the archive is damaged behind what could be read, the end is a failure that names it.
class FOUNDATION_API ArchiveListing final : public provider::IFolderEntryIterator
{
public:
    ArchiveListing(std::shared_ptr<Archive const> archive, provider::StorageIRI const& container, Index::Id folder,
                   Selection selection);

    bool hasEntry() const override { return entry_.has_value(); }
    provider::FolderEntry const& entry() const override { return *entry_; }
    void next() override;
    void reset() override;

private:
    bool advance();
    bool isWanted() const;
    Node const& shown() const;
    provider::FolderEntry makeEntry() const;

    std::shared_ptr<Archive const> archive_;
    provider::StorageIRI const container_;
    Index const& index_;
    Index::Id const folder_;
    Selection const selection_;
    std::optional<fl::filesystem::Wildcards> const pattern_;
    Index::Id current_; ///< the folder itself before the first entry
    std::u16string path_;
    std::optional<provider::FolderEntry> entry_;
};

} // namespace foundation::storage::archive::detail
