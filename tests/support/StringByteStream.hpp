#pragma once

#include <storage/provider/ByteStream.hpp>

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <ios>
#include <memory>
#include <string>
#include <utility>

namespace foundation::tests::support {

/// A stream over a string that others may hold too; with `append`, every write goes to its end.
class StringByteStream final : public storage::provider::ByteStream
{
public:
    explicit StringByteStream(std::shared_ptr<std::string> content, bool append = false)
        : content_(std::move(content)), append_(append)
    {}

protected:
    long doRead(char* buffer, long count) override
    {
        long const taken = std::min(count, size() - position_);
        if (taken <= 0)
            return count == 0 ? 0 : -1;
        std::memcpy(buffer, content_->data() + position_, static_cast<std::size_t>(taken));
        position_ += taken;
        return taken;
    }

    long doWrite(char const* data, long count) override
    {
        if (append_)
            position_ = size();
        long const end = std::max(size(), position_ + count);
        content_->resize(static_cast<std::size_t>(end));
        std::memcpy(content_->data() + position_, data, static_cast<std::size_t>(count));
        position_ += count;
        return count;
    }

    long doSeek(long offset, std::ios_base::seekdir direction) override
    {
        long const origin = direction == std::ios_base::beg ? 0 : direction == std::ios_base::cur ? position_ : size();
        return position_ = origin + offset;
    }

    void doClose() override {}

private:
    long size() const { return static_cast<long>(content_->size()); }

    std::shared_ptr<std::string> content_;
    bool append_;
    long position_ = 0;
};

} // namespace foundation::tests::support
