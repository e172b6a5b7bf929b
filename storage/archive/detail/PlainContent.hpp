#pragma once

#include <storage/archive/detail/Content.hpp>
#include <storage/archive/detail/Source.hpp>

#include <cstdint>
#include <memory>
#include <utility>

namespace foundation::storage::archive::detail {

/// Content that stands in the archive as it is, in one piece. It has no checksum.
class PlainContent final : public Content
{
public:
    PlainContent(std::shared_ptr<Source const> source, std::uint64_t offset)
        : source_(std::move(source)), offset_(offset)
    {}

    std::size_t read(char* buffer, std::size_t count) override
    {
        std::size_t const read = source_->readAt(offset_ + position_, buffer, count);
        position_ += read;
        return read;
    }

    bool seek(std::uint64_t position) override
    {
        position_ = position;
        return true;
    }

    void restart() override { position_ = 0; }
    void finish() override {}

private:
    std::shared_ptr<Source const> source_;
    std::uint64_t const offset_;
    std::uint64_t position_ = 0;
};

} // namespace foundation::storage::archive::detail
