#include <storage/archive/detail/Feed.hpp>

#include <storage/archive/detail/FilterFeed.hpp>
#include <storage/archive/detail/GzipFeed.hpp>

#include <algorithm>
#include <utility>
#include <vector>

namespace foundation::storage::archive::detail {

namespace {

constexpr std::size_t chunk = std::size_t{64} << 10;

class PlainFeed final : public Feed
{
public:
    explicit PlainFeed(std::shared_ptr<Source const> source) : source_(std::move(source)), buffer_(chunk) {}

    std::span<char const> next() override
    {
        std::size_t const read = source_->readAt(position_, buffer_.data(), buffer_.size());
        position_ += read;
        return {buffer_.data(), read};
    }

    std::uint64_t skip(std::uint64_t count) override
    {
        std::uint64_t const skipped = std::min(count, source_->size() - std::min(position_, source_->size()));
        position_ += skipped;
        return skipped;
    }

    bool seek(std::uint64_t position) override
    {
        position_ = position;
        return true;
    }

    std::uint64_t position() const override { return position_; }
    std::uint64_t size() const override { return source_->size(); }

private:
    std::shared_ptr<Source const> source_;
    std::uint64_t position_ = 0;
    std::vector<char> buffer_;
};

} // namespace

bool isCompressed(std::shared_ptr<Source const> const& source)
{
    return source->size() > 0 && FilterFeed(source, {}).compression() != FilterFeed::Compression::None;
}

std::unique_ptr<Feed> openPlainFeed(std::shared_ptr<Source const> source)
{
    return std::make_unique<PlainFeed>(std::move(source));
}

/// libarchive does not look at the checksum of gzip.
std::unique_ptr<Feed> openDecompressedFeed(std::shared_ptr<Source const> source, ArchiveLimits const& limits)
{
    auto feed = std::make_unique<FilterFeed>(source, limits);
    if (feed->compression() == FilterFeed::Compression::Gzip)
        return std::make_unique<GzipFeed>(std::move(source), limits);
    return feed;
}

} // namespace foundation::storage::archive::detail
