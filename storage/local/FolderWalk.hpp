#pragma once

#include <foundation/export.hpp>
#include <storage/local/HeldFolder.hpp>
#include <storage/provider/ExistenceType.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <boost/date_time/posix_time/posix_time_types.hpp>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>

namespace foundation::storage::local {

/// What a walk meets in a folder; size and time of what a link leads to, and only where they were asked for.
struct WalkedEntry
{
    std::u16string name;
    provider::ExistenceTypeExtended type;
    std::optional<std::uint64_t> size = {};
    std::optional<boost::posix_time::ptime> modified = {};
};

enum class WalkedDetail
{
    Names,
    Attributes,
};

/// What becomes of a link where a walk is to begin.
enum class StartLink
{
    Follow,
    Refuse,
};

/// A walk through a local folder and what lies below it, which its user leads.
///
/// Each folder is entered by its name in the one above, and never by a link: whatever is renamed, swapped or linked
/// meanwhile, the walk stays in the tree where it began.
///
/// Errors: `provider::Exception` at what failed, by its path as it was walked.
/// Threads: one at a time.
/// Cost: as a listing; memory and descriptors do not grow with what folders hold, nor with the depth but for a name
/// each.
class FOUNDATION_API FolderWalk
{
public:
    /// Begins in a folder.
    FolderWalk(provider::StorageIRI const& folder, WalkedDetail detail, StartLink link = StartLink::Follow);
    ~FolderWalk();
    FolderWalk(FolderWalk const&) = delete;
    FolderWalk& operator=(FolderWalk const&) = delete;

    /// The next entry of the innermost folder, in the order of the file system; nothing at its end. What vanishes
    /// meanwhile is passed over. A folder that cannot be read is through after the failure.
    std::optional<WalkedEntry> next();

    /// Goes into a folder of the innermost one. Answers false where it has gone, or become something else.
    bool enter(std::u16string const& name);

    /// Goes back to the folder above, or further where folders on the way have been moved away: then throws
    /// `ResourceNotFound` for the first that was.
    void leave();

    /// How many folders have been entered and not left.
    std::size_t depth() const;

    /// Holds the innermost folder.
    HeldFolder hold() const;

private:
    class Impl;
    std::unique_ptr<Impl> impl_;
};

} // namespace foundation::storage::local
