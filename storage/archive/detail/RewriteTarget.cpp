#include <storage/archive/detail/RewriteTarget.hpp>

#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/Source.hpp>
#include <storage/provider/StreamClosePolicy.hpp>

#include <algorithm>
#include <cstring>
#include <utility>

namespace foundation::storage::archive::detail {

using namespace provider;
using Reason = ArchiveException::Reason;

namespace {

constexpr std::size_t mostBuffered = std::size_t{1} << 20;

bool seeks(TransactionalStream& stream)
{
    try {
        return stream.seek(0, std::ios_base::beg) == 0;
    } catch (ByteStreamFailure const&) {
        return false;
    }
}

} // namespace

RewriteTarget::RewriteTarget(StorageItem const& file, std::function<void()> beforeCommit)
    : beforeCommit_(std::move(beforeCommit)), stream_(inStore([&] {
          return file.openTransactionalStream({ByteStreamAccess::ReadWrite, ByteStreamCreate::Create,
                                               ByteStreamTruncate::TruncateExisting, ByteStreamAppend::Overwrite});
      }))
{
    if (!seeks(*stream_))
        draft_ = std::make_unique<Draft>();
}

RewriteTarget::~RewriteTarget() = default;

void RewriteTarget::write(char const* data, std::size_t count)
{
    std::uint64_t const bufferEnd = bufferBegin_ + buffer_.size();
    if (position_ < bufferBegin_ || position_ > bufferEnd || position_ + count > bufferBegin_ + mostBuffered) {
        flushBuffer();
        bufferBegin_ = position_;
    }
    std::size_t const within = static_cast<std::size_t>(position_ - bufferBegin_);
    buffer_.resize(std::max(buffer_.size(), within + count));
    std::memcpy(buffer_.data() + within, data, count);
    position_ += count;
    size_ = std::max(size_, position_);
}

void RewriteTarget::seek(std::uint64_t position)
{
    position_ = position;
}

void RewriteTarget::flushBuffer()
{
    if (buffer_.empty())
        return;
    if (draft_ != nullptr) {
        draft_->write(bufferBegin_, buffer_.data(), buffer_.size());
    } else {
        if (streamPosition_ != bufferBegin_)
            inStore([&] { stream_->seek(static_cast<long>(bufferBegin_), std::ios_base::beg); });
        writeToStream(buffer_.data(), buffer_.size());
        streamPosition_ = bufferBegin_ + buffer_.size();
    }
    buffer_.clear();
}

void RewriteTarget::writeToStream(char const* data, std::size_t count)
{
    while (count > 0) {
        long const written = inStore([&] { return stream_->write(data, static_cast<long>(count)); });
        if (written <= 0 || static_cast<std::size_t>(written) > count)
            throw Fault(Reason::StoreFailed);
        data += written;
        count -= static_cast<std::size_t>(written);
    }
}

void RewriteTarget::commit()
{
    flushBuffer();
    if (draft_ != nullptr)
        sendDraft();
    beforeCommit_();
    isSent_ = true;
    inStore([&] { stream_->close(StreamClosePolicy::Commit); });
}

void RewriteTarget::sendDraft()
{
    std::vector<char> part(mostBuffered);
    for (std::uint64_t sent = 0; sent < draft_->size();) {
        std::size_t const read = draft_->read(sent, part.data(), part.size());
        writeToStream(part.data(), read);
        sent += read;
    }
}

} // namespace foundation::storage::archive::detail
