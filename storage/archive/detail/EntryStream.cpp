#include <storage/archive/detail/EntryStream.hpp>

#include <fl/i18n/convert.hpp>
#include <fl/i18n/utf8.hpp>
#include <storage/provider/ReasonInfo.hpp>

#include <algorithm>
#include <array>
#include <utility>

namespace foundation::storage::archive::detail {

using namespace provider;
using Reason = ArchiveException::Reason;

namespace {

std::string describeAttempt(std::string const& attempt, StorageIRI const& iri)
{
    return "Cannot " + attempt + " \"" + fl::i18n::to_utf8(iri.toString(), fl::i18n::Malformed::Replace) + "\"";
}

} // namespace

ArchiveStreamFailure::ArchiveStreamFailure(std::string const& attempt, StorageIRI const& iri, std::errc error)
    : ByteStreamFailure(describeAttempt(attempt, iri), std::make_error_code(error), ErrorCode::IOError)
{}

ArchiveStreamFailure::ArchiveStreamFailure(std::string const& attempt, StorageIRI const& iri, Fault const& fault)
    : ByteStreamFailure(describeAttempt(attempt, iri) + ": " + describe(fault.reason),
                        std::make_error_code(std::io_errc::stream), fault.code)
{
    *this << ReasonInfo(fl::i18n::to_ustring(describe(fault.reason)));
}

core::except::IException* ArchiveStreamFailure::clone() const
{
    return new ArchiveStreamFailure(*this);
}

void ArchiveStreamFailure::rethrow() const
{
    throw ArchiveStreamFailure(*this);
}

EntryStream::EntryStream(StorageIRI const& iri, std::unique_ptr<Content> content, std::uint64_t size)
    : iri_(iri), content_(std::move(content)), size_(size)
{}

EntryStream::~EntryStream() = default;

void EntryStream::requireOpen(char const* attempt, long count) const
{
    if (content_ == nullptr)
        throw ArchiveStreamFailure(attempt, iri_, std::errc::bad_file_descriptor);
    if (count < 0)
        throw ArchiveStreamFailure(attempt, iri_, std::errc::invalid_argument);
}

long EntryStream::doRead(char* buffer, long count)
{
    requireOpen("read", count);
    if (count == 0)
        return 0;
    try {
        std::size_t const read = readContent(buffer, static_cast<std::size_t>(count));
        return read == 0 ? -1 : static_cast<long>(read);
    } catch (Fault const& fault) {
        throw ArchiveStreamFailure("read", iri_, fault);
    }
}

long EntryStream::doWrite(char const* /*data*/, long /*count*/)
{
    throw ArchiveStreamFailure("write", iri_, std::errc::bad_file_descriptor);
}

long EntryStream::doSeek(long offset, std::ios_base::seekdir direction)
{
    requireOpen("seek in");
    std::uint64_t const origin = direction == std::ios_base::beg   ? 0
                                 : direction == std::ios_base::cur ? position_
                                                                   : size_;
    long position;
    if (__builtin_add_overflow(origin, offset, &position) || position < 0)
        throw ArchiveStreamFailure("seek in", iri_, std::errc::invalid_argument);
    position_ = static_cast<std::uint64_t>(position);
    failure_.reset();
    return position;
}

void EntryStream::doClose()
{
    content_.reset();
}

/// A failure may come in the middle of moving on, so that nothing is read then before the content is begun anew.
std::size_t EntryStream::readContent(char* buffer, std::size_t count)
{
    if (failure_)
        throw Fault(*failure_);
    try {
        return readAtPosition(buffer, count);
    } catch (Fault const& fault) {
        failure_ = fault;
        mustRestart_ = true;
        throw;
    } catch (...) {
        mustRestart_ = true;
        throw;
    }
}

std::size_t EntryStream::readAtPosition(char* buffer, std::size_t count)
{
    if (mustRestart_)
        restart();
    if (size_ == 0 && !isFinished_) {
        content_->finish();
        isFinished_ = true;
    }
    if (position_ >= size_)
        return 0;
    goToPosition();
    std::size_t const read = readOn(buffer, count);
    position_ += read;
    return read;
}

void EntryStream::goToPosition()
{
    if (contentPosition_ == position_)
        return;
    if (content_->seek(position_)) {
        contentPosition_ = position_;
        return;
    }
    if (position_ < contentPosition_)
        restart();
    skip(position_ - contentPosition_);
}

void EntryStream::restart()
{
    content_->restart();
    contentPosition_ = 0;
    mustRestart_ = false;
}

void EntryStream::skip(std::uint64_t count)
{
    std::array<char, 16384> unwanted;
    while (count > 0)
        count -= readOn(unwanted.data(), static_cast<std::size_t>(std::min<std::uint64_t>(count, unwanted.size())));
}

/// What comes next, and never nothing.
std::size_t EntryStream::readOn(char* buffer, std::size_t count)
{
    std::uint64_t const left = size_ - contentPosition_;
    std::size_t const read = content_->read(buffer, static_cast<std::size_t>(std::min<std::uint64_t>(count, left)));
    if (read == 0)
        throw Fault(Reason::Damaged);
    if (read == left)
        content_->finish();
    contentPosition_ += read;
    return read;
}

} // namespace foundation::storage::archive::detail
