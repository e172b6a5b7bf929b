#include <storage/memory/detail/MemoryStream.hpp>

#include <fl/i18n/utf8.hpp>

#include <algorithm>
#include <limits>
#include <new>
#include <utility>

namespace foundation::storage::memory::detail {

using namespace provider;

namespace {

ErrorCode toErrorCode(std::errc error)
{
    switch (error) {
    case std::errc::no_space_on_device:
        return ErrorCode::NoSpaceLeft;
    case std::errc::file_too_large:
        return ErrorCode::FileTooLarge;
    case std::errc::invalid_argument:
        return ErrorCode::InvalidLocation;
    default:
        return ErrorCode::IOError;
    }
}

std::string describe(std::string const& attempt, StorageIRI const& iri)
{
    return "Cannot " + attempt + " \"" + fl::i18n::to_utf8(iri.toString(), fl::i18n::Malformed::Replace) + "\"";
}

} // namespace

MemoryStreamFailure::MemoryStreamFailure(std::string const& attempt, StorageIRI const& iri, std::errc error)
    : ByteStreamFailure(describe(attempt, iri), std::make_error_code(error), toErrorCode(error))
{}

core::except::IException* MemoryStreamFailure::clone() const
{
    return new MemoryStreamFailure(*this);
}

void MemoryStreamFailure::rethrow() const
{
    throw MemoryStreamFailure(*this);
}

void MemoryStream::requireOpen(char const* attempt, long count) const
{
    if (!open_)
        throw MemoryStreamFailure(attempt, iri_, std::errc::bad_file_descriptor);
    if (count < 0)
        throw MemoryStreamFailure(attempt, iri_, std::errc::invalid_argument);
}

long MemoryStream::doSeek(long offset, std::ios_base::seekdir direction)
{
    requireOpen("seek in");
    std::uint64_t const origin = direction == std::ios_base::beg   ? 0
                                 : direction == std::ios_base::cur ? position_
                                                                   : size();
    long position;
    if (__builtin_add_overflow(origin, offset, &position) || position < 0)
        throw MemoryStreamFailure("seek in", iri_, std::errc::invalid_argument);
    position_ = static_cast<std::uint64_t>(position);
    return position;
}

MemoryReadStream::MemoryReadStream(StorageIRI const& iri, Content content)
    : MemoryStream(iri), content_(std::move(content))
{}

long MemoryReadStream::doRead(char* buffer, long count)
{
    requireOpen("read", count);
    std::size_t const read = content_.read(position_, buffer, static_cast<std::size_t>(count));
    position_ += read;
    return read == 0 && count > 0 ? -1 : static_cast<long>(read);
}

long MemoryReadStream::doWrite(char const* /*data*/, long /*count*/)
{
    throw MemoryStreamFailure("write", iri_, std::errc::bad_file_descriptor);
}

void MemoryReadStream::doClose()
{
    open_ = false;
    content_ = Content();
}

MemoryWriteStream::MemoryWriteStream(std::shared_ptr<Tree> tree, StorageIRI const& iri, Tree::OpenedFile opened,
                                     bool appends)
    : MemoryStream(iri),
      tree_(std::move(tree)),
      file_(std::move(opened.file)),
      changed_(opened.changed),
      appends_(appends)
{}

MemoryWriteStream::~MemoryWriteStream()
{
    finish();
}

long MemoryWriteStream::doRead(char* buffer, long count)
{
    requireOpen("read", count);
    std::size_t const read = file_->read(position_, buffer, static_cast<std::size_t>(count));
    position_ += read;
    return read == 0 && count > 0 ? -1 : static_cast<long>(read);
}

long MemoryWriteStream::doWrite(char const* data, long count)
{
    requireOpen("write", count);
    if (count == 0)
        return 0;
    try {
        auto const offset = appends_ ? std::nullopt : std::optional(position_);
        position_ = file_->write(offset, data, static_cast<std::size_t>(count));
    } catch (std::system_error const& refusal) {
        throw MemoryStreamFailure("write", iri_, static_cast<std::errc>(refusal.code().value()));
    } catch (std::bad_alloc const&) {
        throw MemoryStreamFailure("write", iri_, std::errc::no_space_on_device);
    }
    changed_ = true;
    return count;
}

void MemoryWriteStream::doClose()
{
    finish();
}

void MemoryWriteStream::finish() noexcept
{
    if (!std::exchange(open_, false))
        return;
    file_.reset(); // a file that was removed goes with its last stream
    if (changed_)
        tree_->notify(events::Kind::Modified, iri_, events::EntryType::File);
}

} // namespace foundation::storage::memory::detail
