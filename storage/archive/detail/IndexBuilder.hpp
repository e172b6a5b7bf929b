#pragma once

#include <foundation/export.hpp>
#include <storage/archive/ArchiveLimits.hpp>
#include <storage/archive/detail/Index.hpp>

#include <cstdint>
#include <limits>
#include <map>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace foundation::storage::archive::detail {

/// What an archive says of one entry.
struct EntryRecord
{
    static constexpr std::int64_t unknownTime = std::numeric_limits<std::int64_t>::min();

    std::u16string_view path; ///< as in the archive, with whatever it holds
    EntryKind kind = EntryKind::File;
    std::uint64_t size = 0;
    std::int64_t modified = 0;
    std::uint64_t locator = 0;
    std::u16string_view target = {}; ///< of links
};

/// Makes the tree of the entries of an archive, given in their order.
///
/// Whatever the entries are called, each is shown somewhere below the root. Folders that only paths name are there as
/// well. Of entries with one name the last is shown under it, and those before it with "~1", "~2" … behind their names.
/// Folders merge. What lies deeper than allowed is in the root, with its path as its name. A file that is called like a
/// folder gives way to it.
///
/// Errors: `Fault` for what goes beyond the limits.
class FOUNDATION_API IndexBuilder
{
public:
    /// `modified` is the time of the root, and of folders that only paths name.
    IndexBuilder(ArchiveLimits const& limits, std::int64_t modified);

    void add(EntryRecord const& entry);

    /// Gives hard links the content of their files, and the tree away.
    Index finish();

private:
    using Id = Index::Id;

    Id folderOf(std::u16string_view path, std::u16string_view& lastName);
    Id enterFolder(Id parent, std::u16string_view name);
    Id append(Id parent, std::u16string_view name, EntryKind kind);
    Id addFolder(Id parent, std::u16string_view name);
    Id addLeaf(Id parent, std::u16string_view name, EntryKind kind);
    void replace(std::size_t slot, Id parent, Id id);
    std::u16string freeName(Id parent, std::u16string_view name);
    void growSlots();
    void requireRoom(std::size_t units) const;
    void resolveHardLink(Id link);
    std::optional<Id> find(std::u16string_view path) const;

    ArchiveLimits limits_;
    std::int64_t modified_;
    Index index_;
    std::size_t targetUnits_ = 0;
    std::vector<Id> hardLinks_;

    /// How often names were taken; of those alone that were taken twice.
    std::map<std::pair<Id, std::u16string>, std::uint32_t> clashes_;

    /// Most entries lie in the folder of the one before.
    std::u16string lastFolderPath_;
    Id lastFolder_ = Index::root;
};

} // namespace foundation::storage::archive::detail
