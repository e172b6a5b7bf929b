#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/BufferedReader.hpp>
#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/Feed.hpp>
#include <storage/archive/detail/LibArchive.hpp>

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <vector>

namespace foundation::storage::archive::detail {

/// What libarchive unpacks when it looks for compression alone.
class FOUNDATION_API FilterFeed final : public Feed
{
public:
    enum class Compression
    {
        None,
        Gzip,
        Other,
    };

    FilterFeed(std::shared_ptr<Source const> source, ArchiveLimits const& limits);
    ~FilterFeed() override;

    Compression compression() const;

    std::span<char const> next() override;
    std::uint64_t skip(std::uint64_t /*count*/) override { return 0; }
    bool seek(std::uint64_t /*position*/) override { return false; }
    std::uint64_t position() const override { return position_; }
    std::uint64_t size() const override { return 0; }

private:
    static std::ptrdiff_t serve(::archive* archive, void* self, void const** data);

    void requireNothingBehind();
    [[noreturn]] void throwFault() const;

    BufferedReader reader_;
    ArchiveLimits const limits_;
    std::vector<char> input_;
    std::optional<Fault> failure_; ///< of the source, which libarchive knows as an error of reading alone
    LibArchivePtr archive_;
    std::uint64_t position_ = 0;
    bool isAtEnd_ = false;
};

} // namespace foundation::storage::archive::detail
