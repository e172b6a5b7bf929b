#include <storage/archive/detail/GzipFeed.hpp>

#include <storage/archive/detail/Archive.hpp>
#include <storage/archive/detail/Fault.hpp>

#include <new>
#include <utility>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

namespace {

constexpr std::size_t chunk = std::size_t{64} << 10;

/// The largest window, and the header and trailer of gzip.
constexpr int windowOfGzip = 15 + 16;

} // namespace

GzipFeed::GzipFeed(std::shared_ptr<Source const> source, ArchiveLimits const& limits)
    : reader_(std::move(source)), limits_(limits), input_(chunk), output_(4 * chunk)
{
    if (inflateInit2(&stream_, windowOfGzip) != Z_OK)
        throw std::bad_alloc();
}

GzipFeed::~GzipFeed()
{
    inflateEnd(&stream_);
}

std::span<char const> GzipFeed::next()
{
    stream_.next_out = reinterpret_cast<Bytef*>(output_.data());
    stream_.avail_out = static_cast<uInt>(output_.size());
    while (!isAtEnd_ && stream_.avail_out > 0)
        inflateSome();
    std::size_t const size = output_.size() - stream_.avail_out;
    position_ += size;
    requireRatio(limits_, position_, reader_.position());
    return {output_.data(), size};
}

void GzipFeed::inflateSome()
{
    if (stream_.avail_in == 0 && !refill())
        throw Fault(Reason::Damaged);
    int const result = inflate(&stream_, Z_NO_FLUSH);
    if (result == Z_STREAM_END)
        startNextPart();
    else if (result == Z_MEM_ERROR)
        throw std::bad_alloc();
    else if (result != Z_OK)
        throw Fault(Reason::Damaged);
}

bool GzipFeed::refill()
{
    std::size_t const read = reader_.read(input_.data(), input_.size());
    stream_.next_in = reinterpret_cast<Bytef*>(input_.data());
    stream_.avail_in = static_cast<uInt>(read);
    return read > 0;
}

/// Zeros may follow the last part, as on tapes; what else is there is no part, and refused by `inflate`.
void GzipFeed::startNextPart()
{
    inflateReset(&stream_);
    for (;;) {
        if (stream_.avail_in == 0 && !refill()) {
            isAtEnd_ = true;
            return;
        }
        if (*stream_.next_in != 0)
            return;
        ++stream_.next_in;
        --stream_.avail_in;
    }
}

} // namespace foundation::storage::archive::detail
