#include <storage/archive/detail/ZipArchive.hpp>

#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/IndexBuilder.hpp>
#include <storage/archive/detail/ZipContent.hpp>
#include <storage/archive/detail/zipText.hpp>

#include <algorithm>
#include <string>
#include <sys/stat.h>
#include <thread>
#include <utility>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

namespace {

constexpr std::uint64_t longestTarget = 4096;

constexpr std::size_t mostHandlesOfAll = 8;
constexpr std::uint64_t entriesOfALargeDirectory = 20'000;

/// More handles than processors gain nothing, and each holds the whole directory.
std::size_t mostHandlesFor(std::uint64_t entries)
{
    if (entries > entriesOfALargeDirectory)
        return 2;
    return std::clamp<std::size_t>(std::thread::hardware_concurrency(), 2, mostHandlesOfAll);
}

EntryKind kindOf(ZipEntry const& entry)
{
    if (entry.name.ends_with(u'/') || (entry.isFolder && entry.size == 0))
        return EntryKind::Folder;
    switch (entry.unixMode & S_IFMT) {
    case S_IFLNK:
        return EntryKind::SymbolicLink;
    case S_IFCHR:
    case S_IFBLK:
    case S_IFIFO:
    case S_IFSOCK:
        return EntryKind::Special;
    default:
        return EntryKind::File;
    }
}

/// The content of a link. One that cannot be read, or is not as long as it is said to be, leads nowhere and spoils
/// nothing else.
std::string readTarget(ZipHandle& handle, std::uint64_t number, ZipEntry const& entry)
{
    if (entry.isEncrypted || entry.size > longestTarget)
        return {};
    try {
        std::string target(static_cast<std::size_t>(entry.size) + 1, '\0');
        ZipHandle::File const file = handle.open(number);
        std::size_t length = 0;
        while (std::size_t const read = handle.read(file, target.data() + length, target.size() - length))
            length += read;
        target.resize(length);
        return length == entry.size ? target : std::string();
    } catch (Fault const& fault) {
        if (fault.reason == Reason::StoreFailed || fault.reason == Reason::Changed)
            throw;
        return {};
    }
}

void addEntry(IndexBuilder& builder, ZipHandle& handle, std::uint64_t number)
{
    ZipEntry const entry = handle.entry(number);
    std::u16string target;
    EntryKind const kind = kindOf(entry);
    if (kind == EntryKind::SymbolicLink)
        target = fromZipText(readTarget(handle, number, entry));
    builder.add({.path = entry.name,
                 .kind = kind,
                 .size = entry.size,
                 .modified = entry.modified,
                 .locator = ZipArchive::locatorOf(number, entry.isStored),
                 .target = target});
}

Index readIndex(ZipHandle& handle, ArchiveLimits const& limits, std::int64_t modified)
{
    std::uint64_t const size = handle.size();
    if (size > limits.entries)
        throw Fault(Reason::TooManyEntries);
    IndexBuilder builder(limits, modified);
    for (std::uint64_t number = 0; number != size; ++number)
        addEntry(builder, handle, number);
    return builder.finish();
}

/// As the first entry does, or the end of a directory without entries.
bool beginsAsZip(Source const& source)
{
    std::string begin(4, '\0');
    begin.resize(source.readAt(0, begin.data(), begin.size()));
    return begin == "PK\x03\x04" || begin == "PK\x05\x06";
}

} // namespace

ZipArchive::ZipArchive(std::shared_ptr<Source const> source, ArchiveLimits const& limits, std::int64_t modified)
    : source_(std::move(source)), limits_(limits), beginsAsZip_(beginsAsZip(*source_))
{
    auto handle = std::make_unique<ZipHandle>(source_, limits_);
    index_ = readIndex(*handle, limits_, modified);
    size_ = handle->size();
    slots_.push_back({std::move(handle), 0});
}

bool ZipArchive::isRandomAccess(Index::Id file) const
{
    return isStored(index().at(file));
}

std::unique_ptr<Content> ZipArchive::open(Index::Id file) const
{
    Node const& node = index().at(file);
    auto lease = std::make_unique<Lease>(std::static_pointer_cast<ZipArchive const>(shared_from_this()));
    {
        std::lock_guard const lock(lease->handle().mutex());
        ZipEntry const entry = lease->handle().entry(numberOf(node));
        if (entry.isEncrypted)
            throw Fault(Reason::Encrypted);
        // An entry may say that it takes more room in the archive than there is.
        requireWithinLimits(limits_, entry.size, std::min(entry.sizeInArchive, source_->size()));
    }
    return std::make_unique<ZipContent>(std::move(lease), numberOf(node), isStored(node));
}

ZipArchive::Lease::Lease(std::shared_ptr<ZipArchive const> archive)
    : archive_(std::move(archive)), slot_(archive_->takeSlot())
{
    try {
        handle_ = archive_->handleOf(slot_);
    } catch (...) {
        archive_->release(slot_);
        throw;
    }
}

ZipArchive::Lease::~Lease()
{
    archive_->release(slot_);
}

/// A free handle, else a new one, else the one with the fewest users. One that is being made is shared by nobody.
std::size_t ZipArchive::takeSlot() const
{
    std::lock_guard const lock(mutex_);
    auto const load = [](Slot const& slot) { return slot.handle == nullptr && slot.users > 0 ? ~0u : slot.users; };
    auto slot =
        std::min_element(slots_.begin(), slots_.end(), [&](Slot const& a, Slot const& b) { return load(a) < load(b); });
    if (slot->users > 0 && slots_.size() < mostHandlesFor(size_))
        slot = slots_.insert(slots_.end(), Slot{});
    ++slot->users;
    return static_cast<std::size_t>(slot - slots_.begin());
}

/// Only who took a slot first makes the handle for it, unlocked.
ZipHandle* ZipArchive::handleOf(std::size_t slot) const
{
    {
        std::lock_guard const lock(mutex_);
        if (slots_[slot].handle != nullptr)
            return slots_[slot].handle.get();
    }
    auto handle = std::make_unique<ZipHandle>(source_, limits_);
    if (handle->size() != size_)
        throw Fault(Reason::Changed);
    std::lock_guard const lock(mutex_);
    slots_[slot].handle = std::move(handle);
    return slots_[slot].handle.get();
}

void ZipArchive::release(std::size_t slot) const noexcept
{
    std::lock_guard const lock(mutex_);
    --slots_[slot].users;
}

} // namespace foundation::storage::archive::detail
