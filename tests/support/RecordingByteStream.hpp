#pragma once

#include <storage/provider/ByteStream.hpp>
#include <tests/support/CallLog.hpp>

#include <algorithm>
#include <cstddef>
#include <functional>
#include <ios>
#include <limits>
#include <string>
#include <utility>

namespace foundation::tests::support {

/// A stream that logs what it is asked, as in "source.read(4096)", and does what it is told.
/// Told nothing it is at its end, takes every byte written, answers the offset of a seek, and closes.
class RecordingByteStream final : public storage::provider::ByteStream
{
public:
    RecordingByteStream() = default;
    RecordingByteStream(CallLog& log, std::string name) : log_(&log), name_(std::move(name)) {}
    ~RecordingByteStream() override { onDestruction(); }

    std::function<long(char*, long)> onRead = [](char*, long) { return -1L; };
    std::function<long(char const*, long)> onWrite = [](char const*, long count) { return count; };
    std::function<long(long, std::ios_base::seekdir)> onSeek = [](long offset, std::ios_base::seekdir) {
        return offset;
    };
    std::function<void()> onClose = [] {};
    std::function<void()> onDestruction = [] {};

protected:
    long doRead(char* buffer, long count) override
    {
        record("read(" + std::to_string(count) + ")");
        return onRead(buffer, count);
    }

    long doWrite(char const* data, long count) override
    {
        record("write(" + std::to_string(count) + ")");
        return onWrite(data, count);
    }

    long doSeek(long offset, std::ios_base::seekdir direction) override
    {
        char const* const names[] = {"beg", "cur", "end"};
        record("seek(" + std::to_string(offset) + ", " + names[static_cast<int>(direction)] + ")");
        return onSeek(offset, direction);
    }

    void doClose() override
    {
        record("close()");
        onClose();
    }

private:
    void record(std::string const& call)
    {
        if (log_ != nullptr)
            log_->push_back(name_ + "." + call);
    }

    CallLog* log_ = nullptr;
    std::string name_;
};

inline constexpr long anyNumber = std::numeric_limits<long>::max();

/// For `onRead`: hands out `content`, at most `atOnce` bytes a time, and then answers -1.
inline auto readsFrom(std::string content, long atOnce = anyNumber)
{
    return [content = std::move(content), atOnce, position = std::size_t{0}](char* buffer, long count) mutable {
        std::size_t const taken = content.copy(buffer, static_cast<std::size_t>(std::min(count, atOnce)), position);
        position += taken;
        return taken == 0 ? -1L : static_cast<long>(taken);
    };
}

/// For `onWrite`: appends to `content`, at most `atOnce` bytes a time.
inline auto writesTo(std::string& content, long atOnce = anyNumber)
{
    return [&content, atOnce](char const* data, long count) {
        long const taken = std::min(count, atOnce);
        content.append(data, static_cast<std::size_t>(taken));
        return taken;
    };
}

/// For every operation: throws `error`.
template <class Error>
auto throwing(Error error)
{
    return [error = std::move(error)](auto&&...) -> long { throw error; };
}

} // namespace foundation::tests::support
