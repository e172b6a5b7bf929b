#pragma once

#include <foundation/export.hpp>
#include <foundation/storage/events/EntryType.hpp>
#include <storage/local/detail/Inotify.hpp>

#include <cstdint>
#include <map>
#include <string>
#include <utility>
#include <vector>

namespace foundation::storage::local::detail {

/// An entry of a watched folder; without a name, the folder itself.
struct WatchedEntry
{
    int watch = -1;
    std::string name = {};

    auto operator<=>(WatchedEntry const&) const = default;
};

/// What happened in a watched folder, or to it.
struct FolderChange
{
    enum class What
    {
        Created,
        Arrived, ///< by a move from where nobody watches, perhaps in the place of another file
        Removed, ///< or moved to where nobody watches
        Modified,
        AttributesChanged,
        Moved,       ///< to `target`
        FolderMoved, ///< the watched folder itself, nobody knows where to; it may be watched still
        FolderGone,  ///< the watched folder is removed or unmounted, and its watch is over
        Lost,        ///< the queue was full: any number of changes, in any folder, are missing
    };

    What what;
    events::EntryType type;
    WatchedEntry entry;
    WatchedEntry target = {};
};

/// Makes changes of the events that the kernel tells one by one: joins the two halves of a move, and leaves out
/// repetitions that one read brings together.
class FOUNDATION_API ChangeDecoder
{
public:
    /// What happened, in its order, by what one read brought, which may be nothing.
    ///
    /// A move whose second half is missing is held back, with all that comes after it, until the next call: without a
    /// second half in that either, the entry was moved to where nobody watches.
    std::vector<FolderChange> decode(std::vector<RawEvent> read);

    /// Whether something waits for the next call, which should not be long in coming.
    bool holdsBack() const { return !held_.empty(); }

private:
    using Arrivals = std::map<std::uint32_t, RawEvent*>;

    bool departs(RawEvent const& event, Arrivals const& arrivals, bool isLate);
    void add(FolderChange change);

    std::vector<RawEvent> held_;
    std::vector<FolderChange> changes_;
    std::map<WatchedEntry, FolderChange::What> latest_;
};

} // namespace foundation::storage::local::detail
