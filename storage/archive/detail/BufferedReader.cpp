#include <storage/archive/detail/BufferedReader.hpp>

#include <algorithm>
#include <cstring>

namespace foundation::storage::archive::detail {

namespace {

/// Of what is read anywhere, and of what follows that which was read last.
constexpr std::size_t firstChunk = std::size_t{8} << 10;
constexpr std::size_t nextChunk = std::size_t{128} << 10;

} // namespace

bool BufferedReader::isBuffered() const
{
    return position_ >= bufferBegin_ && position_ - bufferBegin_ < buffer_.size();
}

std::size_t BufferedReader::read(char* data, std::size_t count)
{
    std::size_t done = 0;
    while (done < count) {
        if (!isBuffered())
            fill();
        if (!isBuffered())
            break;
        std::size_t const offset = static_cast<std::size_t>(position_ - bufferBegin_);
        std::size_t const taken = std::min(count - done, buffer_.size() - offset);
        std::memcpy(data + done, buffer_.data() + offset, taken);
        position_ += taken;
        done += taken;
    }
    return done;
}

void BufferedReader::fill()
{
    bool const followsOn = position_ == bufferBegin_ + buffer_.size();
    std::size_t const chunk = followsOn ? nextChunk : firstChunk;
    buffer_.resize(chunk);
    bufferBegin_ = position_;
    try {
        buffer_.resize(source_->readAt(position_, buffer_.data(), chunk));
    } catch (...) {
        buffer_.clear();
        throw;
    }
}

} // namespace foundation::storage::archive::detail
