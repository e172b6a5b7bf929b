#include <storage/local/detail/Subscription.hpp>

#include <algorithm>
#include <fcntl.h>
#include <fl/filesystem/native_name.hpp>
#include <sys/inotify.h>
#include <utility>

namespace foundation::storage::local::detail {

using events::EntryType;
using events::Kind;
using provider::StorageIRI;
using What = FolderChange::What;

namespace {

/// What is open but removed already tells nobody anything.
constexpr std::uint32_t alwaysWatched =
    IN_CREATE | IN_DELETE | IN_MOVED_FROM | IN_MOVED_TO | IN_DELETE_SELF | IN_MOVE_SELF | IN_EXCL_UNLINK;

std::optional<Kind> plainKindOf(What what)
{
    switch (what) {
    case What::Created:
        return Kind::Created;
    case What::Removed:
        return Kind::Removed;
    case What::Modified:
        return Kind::Modified;
    case What::AttributesChanged:
        return Kind::AttributesChanged;
    default:
        return std::nullopt;
    }
}

} // namespace

Subscription::Subscription(Interest interest) : interest_(std::move(interest)), key_(folderKey(interest_.path)) {}

std::uint32_t Subscription::mask() const
{
    return alwaysWatched | (wants(Kind::Modified) ? IN_MODIFY : 0U) | (wants(Kind::AttributesChanged) ? IN_ATTRIB : 0U);
}

int Subscription::openFolder(FileDescriptor& folder) const
{
    return interest_.root->open(interest_.path, O_PATH | O_DIRECTORY, folder);
}

bool Subscription::wants(Kind kind) const
{
    return std::find(interest_.kinds.begin(), interest_.kinds.end(), kind) != interest_.kinds.end();
}

bool Subscription::isAbout(WatchedEntry const& entry) const
{
    return entry.watch == watch && (!interest_.name || *interest_.name == entry.name);
}

StorageIRI Subscription::locationOf(WatchedEntry const& entry) const
{
    if (entry.name.empty() || interest_.name == entry.name)
        return interest_.subject;
    return StorageIRI(interest_.folder, fl::filesystem::from_native_bytes(entry.name));
}

/// What arrives under the name of a single entry is other content to those who did not ask where it comes from.
std::optional<Kind> Subscription::kindOfArrival() const
{
    if (wants(Kind::Created))
        return Kind::Created;
    return interest_.name ? Kind::Modified : std::optional<Kind>();
}

/// Who did not ask for moves is told of one that crosses the bounds of what it watches as if nobody watched the rest.
std::optional<Kind> Subscription::kindOfMove(FolderChange const& change) const
{
    bool const leaves = isAbout(change.entry);
    bool const arrives = isAbout(change.target);
    if (!leaves && !arrives)
        return std::nullopt;
    if (wants(Kind::Moved) || (leaves && arrives))
        return Kind::Moved;
    return leaves ? Kind::Removed : kindOfArrival();
}

std::optional<Kind> Subscription::kindOf(FolderChange const& change) const
{
    if (change.what == What::Moved)
        return kindOfMove(change);
    if (!isAbout(change.entry))
        return std::nullopt;
    return change.what == What::Arrived ? kindOfArrival() : plainKindOf(change.what);
}

std::optional<Notice> Subscription::noticeOf(FolderChange const& change, StorageIRI const& other) const
{
    if (change.what == What::Lost)
        return noticeOfLoss();
    std::optional<Kind> const kind = kindOf(change);
    if (!kind || !wants(*kind))
        return std::nullopt;
    auto const locationIn = [&](WatchedEntry const& entry) {
        return entry.watch == watch ? locationOf(entry)
                                    : StorageIRI(other, fl::filesystem::from_native_bytes(entry.name));
    };
    if (*kind == Kind::Moved)
        return Notice{*kind, locationIn(change.entry), locationIn(change.target), change.type};
    StorageIRI const location = locationOf(isAbout(change.entry) ? change.entry : change.target);
    return Notice{*kind, location, location, change.type};
}

/// Told to everybody: who misses it would take silence for peace.
std::optional<Notice> Subscription::noticeOfLoss() const
{
    EntryType const type = interest_.name ? EntryType::Unknown : EntryType::Folder;
    Notice notice{Kind::Modified, interest_.subject, interest_.subject, type};
    notice.details.put("overflow", true);
    return notice;
}

std::optional<Notice> Subscription::noticeOfTheEnd() const
{
    if (!wants(Kind::Removed))
        return std::nullopt;
    return Notice{Kind::Removed, interest_.folder, interest_.folder, EntryType::Folder};
}

void Subscription::tell(Notice const& notice) const
{
    interest_.callback(notice.kind, notice.location, notice.second, notice.type, notice.details);
}

std::string folderKey(std::string const& path)
{
    std::string key;
    for (std::size_t start = 0; start < path.size();) {
        std::size_t const end = std::min(path.find('/', start), path.size());
        if (end != start && path.compare(start, end - start, ".") != 0)
            key.append(1, '/').append(path, start, end - start);
        start = end + 1;
    }
    return key.empty() ? "/" : key;
}

} // namespace foundation::storage::local::detail
