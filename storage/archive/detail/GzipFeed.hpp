#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/BufferedReader.hpp>
#include <storage/archive/detail/Feed.hpp>

#include <vector>
#include <zlib.h>

namespace foundation::storage::archive::detail {

/// What gzip has compressed, in one part or several, each compared with its checksum by zlib.
class FOUNDATION_API GzipFeed final : public Feed
{
public:
    GzipFeed(std::shared_ptr<Source const> source, ArchiveLimits const& limits);
    ~GzipFeed() override;

    std::span<char const> next() override;
    std::uint64_t skip(std::uint64_t /*count*/) override { return 0; }
    bool seek(std::uint64_t /*position*/) override { return false; }
    std::uint64_t position() const override { return position_; }
    std::uint64_t size() const override { return 0; }

private:
    bool refill();
    void inflateSome();
    void startNextPart();

    BufferedReader reader_;
    ArchiveLimits const limits_;
    std::vector<char> input_;
    std::vector<char> output_;
    ::z_stream stream_ = {};
    std::uint64_t position_ = 0;
    bool isAtEnd_ = false;
};

} // namespace foundation::storage::archive::detail
