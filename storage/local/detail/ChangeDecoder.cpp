#include <storage/local/detail/ChangeDecoder.hpp>

#include <iterator>
#include <sys/inotify.h>

namespace foundation::storage::local::detail {

using events::EntryType;
using What = FolderChange::What;

namespace {

/// A second half that was joined with its first says nothing by itself.
constexpr std::uint32_t saysNothing = 0;

EntryType typeOf(RawEvent const& event)
{
    return event.name.empty() || (event.mask & IN_ISDIR) != 0 ? EntryType::Folder : EntryType::File;
}

struct Meaning
{
    std::uint32_t mask;
    What what;
};

/// The kernel drops a watch, and says so, after what made it useless: that it did is all that counts.
constexpr Meaning meanings[]{
    {IN_Q_OVERFLOW, What::Lost}, {IN_IGNORED, What::FolderGone},       {IN_MOVE_SELF, What::FolderMoved},
    {IN_CREATE, What::Created},  {IN_MOVED_TO, What::Arrived},         {IN_DELETE, What::Removed},
    {IN_MODIFY, What::Modified}, {IN_ATTRIB, What::AttributesChanged},
};

Meaning const* meaningOf(RawEvent const& event)
{
    for (Meaning const& meaning : meanings) {
        if ((event.mask & meaning.mask) != 0)
            return &meaning;
    }
    return nullptr;
}

} // namespace

std::vector<FolderChange> ChangeDecoder::decode(std::vector<RawEvent> read)
{
    std::size_t const late = held_.size();
    held_.insert(held_.end(), std::make_move_iterator(read.begin()), std::make_move_iterator(read.end()));
    Arrivals arrivals;
    for (RawEvent& event : held_) {
        if ((event.mask & IN_MOVED_TO) != 0)
            arrivals[event.cookie] = &event;
    }
    latest_.clear();
    std::size_t done = 0;
    for (; done < held_.size(); ++done) {
        RawEvent const& event = held_[done];
        if ((event.mask & IN_MOVED_FROM) != 0) {
            if (!departs(event, arrivals, done < late))
                break;
        } else if (Meaning const* const meaning = meaningOf(event)) {
            add({meaning->what, typeOf(event), {event.watch, event.name}});
        }
    }
    held_.erase(held_.begin(), held_.begin() + static_cast<std::ptrdiff_t>(done));
    return std::exchange(changes_, {});
}

/// Answers whether it is known where to. Both folders are locked during a move, so that nothing comes or goes in them
/// between its halves, and the change can take the place of the first.
bool ChangeDecoder::departs(RawEvent const& event, Arrivals const& arrivals, bool isLate)
{
    auto const arrival = arrivals.find(event.cookie);
    if (arrival != arrivals.end()) {
        RawEvent& second = *arrival->second;
        add({What::Moved, typeOf(event), {event.watch, event.name}, {second.watch, second.name}});
        second.mask = saysNothing;
        return true;
    }
    if (isLate)
        add({What::Removed, typeOf(event), {event.watch, event.name}});
    return isLate;
}

void ChangeDecoder::add(FolderChange change)
{
    auto const [latest, isFirst] = latest_.try_emplace(change.entry, change.what);
    bool const mayRepeat = change.what == What::Modified || change.what == What::AttributesChanged;
    if (!isFirst && mayRepeat && latest->second == change.what)
        return;
    latest->second = change.what;
    if (change.what == What::Moved)
        latest_[change.target] = change.what;
    else if (change.what == What::Lost)
        latest_.clear();
    changes_.push_back(std::move(change));
}

} // namespace foundation::storage::local::detail
