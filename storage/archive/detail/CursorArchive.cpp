#include <storage/archive/detail/CursorArchive.hpp>

#include <storage/archive/detail/CursorContent.hpp>
#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/Feed.hpp>
#include <storage/archive/detail/IndexBuilder.hpp>
#include <storage/archive/detail/PlainContent.hpp>

#include <algorithm>
#include <array>
#include <optional>
#include <string_view>
#include <utility>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

namespace {

/// Each holds the state of a decompressor, and that of a 7z or an image what it knows of all entries.
constexpr std::size_t mostIdleOfFew = 8;
constexpr std::size_t mostIdleOfMany = 2;
constexpr std::size_t manyEntries = 20'000;

/// The locator of an entry: the offset of content that stands in the archive as it is, else the number of the entry,
/// shifted to make room for these.
constexpr std::uint64_t encryptedBit = 1;
constexpr std::uint64_t plainBit = 2;
constexpr unsigned locatorShift = 2;

std::uint64_t locatorOf(Cursor const& cursor, bool isCompressed)
{
    auto const offset = isCompressed ? std::nullopt : cursor.offsetOfPlainContent();
    if (offset)
        return *offset << locatorShift | plainBit;
    return cursor.number() << locatorShift | (cursor.isEncrypted() ? encryptedBit : 0);
}

constexpr std::string_view beginningInZisofs("\x37\xE4\x53\x96\xC9\xDB\xD6\x07", 8);

/// Of a zip that is not as it should be: enough for short names, in as many entries as may be.
std::uint64_t mostBytesOfDirectory(ArchiveLimits const& limits)
{
    constexpr std::uint64_t bytesOfARecord = 64;
    constexpr std::uint64_t bytesBeside = std::uint64_t{1} << 20;
    return limits.entries * bytesOfARecord + bytesBeside;
}

bool mayBeCompressed(ArchiveFormat format)
{
    return format == ArchiveFormat::Tar || format == ArchiveFormat::Cpio;
}

} // namespace

CursorArchive::CursorArchive(ArchiveFormat format, std::shared_ptr<Source const> source, ArchiveLimits const& limits,
                             std::int64_t modified)
    : format_(format),
      source_(std::move(source)),
      limits_(limits),
      isCompressed_(mayBeCompressed(format) && isCompressed(source_))
{
    readIndex(modified);
}

std::unique_ptr<Cursor> CursorArchive::newCursor() const
{
    return std::make_unique<Cursor>(format_,
                                    isCompressed_ ? openDecompressedFeed(source_, limits_) : openPlainFeed(source_),
                                    format_ == ArchiveFormat::Zip ? mostBytesOfDirectory(limits_) : Cursor::anyNumber);
}

/// Damage to the compression of the whole spoils all; damage to the archive alone only what comes after it.
void CursorArchive::readIndex(std::int64_t modified)
{
    IndexBuilder builder(limits_, modified);
    auto const cursor = newCursor();
    try {
        readEntries(builder, *cursor, modified);
    } catch (Fault const& fault) {
        if (fault.reason != Reason::Damaged || isCompressed_)
            throw;
        isIncomplete_ = true;
    }
    if (isCompressed_)
        cursor->drain();
    index_ = builder.finish();
}

void CursorArchive::readEntries(IndexBuilder& builder, Cursor& cursor, std::int64_t modified) const
{
    while (cursor.next()) {
        EntryRecord record = cursor.record();
        record.locator = locatorOf(cursor, isCompressed_);
        if (record.modified == EntryRecord::unknownTime)
            record.modified = modified;
        builder.add(record);
    }
}

bool CursorArchive::isRandomAccess(Index::Id file) const
{
    std::uint64_t const locator = index().at(file).locator;
    return (locator & plainBit) != 0 && !isCompressedInImage(locator >> locatorShift);
}

/// Nothing but the content tells of a file that was compressed for an image. One that merely looks so loses no more
/// than being read at any place at once.
bool CursorArchive::isCompressedInImage(std::uint64_t offset) const
{
    std::array<char, beginningInZisofs.size()> beginning;
    return format_ == ArchiveFormat::Iso &&
           source_->readAt(offset, beginning.data(), beginning.size()) == beginning.size() &&
           std::string_view(beginning.data(), beginning.size()) == beginningInZisofs;
}

std::uint64_t CursorArchive::numberAt(std::uint64_t offset, std::uint64_t size) const
{
    auto const cursor = newCursor();
    while (cursor->next()) {
        if (cursor->offsetOfPlainContent() == offset && cursor->size() == size)
            return cursor->number();
    }
    throw Fault(Reason::Changed);
}

/// The size of the archive stands for that of the entry in it, which nothing tells: gaps take no room in a tar, and
/// what is compressed together has no size of its own.
std::unique_ptr<Content> CursorArchive::open(Index::Id file) const
{
    Node const& node = index().at(file);
    if ((node.locator & encryptedBit) != 0)
        throw Fault(Reason::Encrypted);
    if (isRandomAccess(file))
        return openPlain(node.locator >> locatorShift, node.size);
    requireWithinLimits(limits_, node.size, source_->size());
    std::uint64_t const place = node.locator >> locatorShift;
    return std::make_unique<CursorContent>(std::static_pointer_cast<CursorArchive const>(shared_from_this()),
                                           (node.locator & plainBit) != 0 ? numberAt(place, node.size) : place,
                                           node.size);
}

/// Content that breaks off is not begun.
std::unique_ptr<Content> CursorArchive::openPlain(std::uint64_t offset, std::uint64_t size) const
{
    if (offset > source_->size() || size > source_->size() - offset)
        throw Fault(Reason::Damaged);
    requireWithinLimits(limits_, size, size);
    return std::make_unique<PlainContent>(source_, offset);
}

std::unique_ptr<Cursor> CursorArchive::takeCursor(std::uint64_t number, std::uint64_t size) const
{
    std::unique_ptr<Cursor> cursor = takeIdle(number);
    if (cursor == nullptr)
        cursor = newCursor();
    while (cursor->count() <= number) {
        if (!cursor->next())
            throw Fault(Reason::Changed);
    }
    if (cursor->size() != size)
        throw Fault(Reason::Changed);
    return cursor;
}

std::size_t CursorArchive::mostIdle() const
{
    return index().size() > manyEntries ? mostIdleOfMany : mostIdleOfFew;
}

/// The one that is nearest before the entry. Where there is none, and one more will be made, the one that has waited
/// longest makes room for it.
std::unique_ptr<Cursor> CursorArchive::takeIdle(std::uint64_t number) const
{
    std::unique_ptr<Cursor> gone; // goes unlocked
    std::lock_guard const lock(mutex_);
    auto nearest = idle_.end();
    for (auto cursor = idle_.begin(); cursor != idle_.end(); ++cursor) {
        if ((*cursor)->count() <= number && (nearest == idle_.end() || (*cursor)->count() > (*nearest)->count()))
            nearest = cursor;
    }
    if (nearest == idle_.end()) {
        if (idle_.size() >= mostIdle())
            gone = takeOldest();
        return nullptr;
    }
    std::unique_ptr<Cursor> cursor = std::move(*nearest);
    idle_.erase(nearest);
    return cursor;
}

/// Of too many, the one that has waited longest goes, unlocked.
void CursorArchive::giveBack(std::unique_ptr<Cursor> cursor) const
{
    std::unique_ptr<Cursor> gone;
    std::lock_guard const lock(mutex_);
    idle_.push_back(std::move(cursor));
    if (idle_.size() > mostIdle())
        gone = takeOldest();
}

std::unique_ptr<Cursor> CursorArchive::takeOldest() const
{
    std::unique_ptr<Cursor> oldest = std::move(idle_.front());
    idle_.erase(idle_.begin());
    return oldest;
}

} // namespace foundation::storage::archive::detail
