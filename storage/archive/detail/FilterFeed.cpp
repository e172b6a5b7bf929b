#include <storage/archive/detail/FilterFeed.hpp>

#include <storage/archive/detail/Archive.hpp>

#include <algorithm>
#include <archive.h>
#include <cerrno>
#include <exception>
#include <utility>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

namespace {

constexpr std::size_t chunk = std::size_t{64} << 10;

} // namespace

FilterFeed::FilterFeed(std::shared_ptr<Source const> source, ArchiveLimits const& limits)
    : reader_(std::move(source)), limits_(limits), input_(chunk), archive_(newLibArchive())
{
    ::archive* const a = archive_.get();
    supportCompression(a);
    archive_read_support_format_raw(a);
    if (archive_read_open(a, this, nullptr, serve, nullptr) != ARCHIVE_OK)
        throwFault();
    archive_entry* entry = nullptr;
    int const found = archive_read_next_header(a, &entry);
    if (found != ARCHIVE_OK && found != ARCHIVE_EOF)
        throwFault();
    isAtEnd_ = found == ARCHIVE_EOF;
}

FilterFeed::~FilterFeed() = default;

/// The reading of the source counts as a filter, too. What is compressed twice is left to whoever made it.
FilterFeed::Compression FilterFeed::compression() const
{
    int const filters = archive_filter_count(archive_.get());
    if (filters > 2)
        throw Fault(Reason::UnsupportedMethod);
    if (filters < 2)
        return Compression::None;
    return archive_filter_code(archive_.get(), 0) == ARCHIVE_FILTER_GZIP ? Compression::Gzip : Compression::Other;
}

std::span<char const> FilterFeed::next()
{
    if (isAtEnd_)
        return {};
    void const* data = nullptr;
    std::size_t size = 0;
    la_int64_t offset = 0;
    int const result = archive_read_data_block(archive_.get(), &data, &size, &offset);
    if (result == ARCHIVE_EOF) {
        isAtEnd_ = true;
        requireNothingBehind();
        return {};
    }
    if (result != ARCHIVE_OK)
        throwFault();
    position_ += size;
    requireRatio(limits_, position_, reader_.position());
    return {static_cast<char const*>(data), size};
}

/// libarchive ends where the next part does not look like one, as if it were not there. Zeros may follow, as on tapes.
void FilterFeed::requireNothingBehind()
{
    reader_.seek(static_cast<std::uint64_t>(archive_filter_bytes(archive_.get(), -1)));
    while (std::size_t const read = reader_.read(input_.data(), input_.size())) {
        auto const end = input_.begin() + static_cast<std::ptrdiff_t>(read);
        if (std::any_of(input_.begin(), end, [](char byte) { return byte != '\0'; }))
            throw Fault(Reason::Damaged);
    }
}

std::ptrdiff_t FilterFeed::serve(::archive* archive, void* self, void const** data)
{
    FilterFeed& feed = *static_cast<FilterFeed*>(self);
    try {
        *data = feed.input_.data();
        return static_cast<std::ptrdiff_t>(feed.reader_.read(feed.input_.data(), feed.input_.size()));
    } catch (Fault const& fault) {
        feed.failure_ = fault;
    } catch (std::exception const&) {
        feed.failure_ = Fault(Reason::StoreFailed);
    }
    archive_set_error(archive, EIO, "reading failed");
    return ARCHIVE_FATAL;
}

/// libarchive is out of memory when a decompressor asks for more than anybody needs.
void FilterFeed::throwFault() const
{
    if (failure_)
        throw Fault(*failure_);
    throw Fault(archive_errno(archive_.get()) == ENOMEM ? Reason::UnsupportedMethod : Reason::Damaged);
}

} // namespace foundation::storage::archive::detail
