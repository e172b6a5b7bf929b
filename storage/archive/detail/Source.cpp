#include <storage/archive/detail/Source.hpp>

#include <storage/archive/detail/Spool.hpp>
#include <storage/archive/detail/StreamSource.hpp>

#include <boost/any.hpp>

#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace foundation::storage::archive::detail {

using namespace provider;

namespace {

/// How a file in another archive can be read; empty for other files.
std::string accessOf(StorageItem const& file)
{
    ExtendedAttributes const attributes = file.getExtendedAttributes();
    if (!attributes.hasAttribute(accessAttribute))
        return {};
    boost::any const value = attributes.getAttribute(accessAttribute);
    auto const* const access = boost::any_cast<std::string>(&value);
    return access == nullptr ? std::string() : *access;
}

/// Has whoever keeps the checksum of a file look at it, at the end.
void readThrough(ByteStream& stream)
{
    std::vector<char> buffer(std::size_t{256} << 10);
    try {
        while (stream.read(buffer.data(), static_cast<long>(buffer.size())) > 0) {
        }
    } catch (ByteStreamFailure const& failure) {
        if (failure.getErrorCode() == ErrorCode::IOError)
            throw Fault(ArchiveException::Reason::Damaged);
        throw Fault(ArchiveException::Reason::StoreFailed, failure.getErrorCode());
    }
}

/// Nothing for a stream that cannot be moved, which then still stands at its beginning.
std::optional<std::uint64_t> sizeOf(ByteStream& stream)
{
    try {
        long const end = stream.seek(0, std::ios_base::end);
        return end < 0 ? std::nullopt : std::optional(static_cast<std::uint64_t>(end));
    } catch (ByteStreamFailure const&) {
        return std::nullopt;
    }
}

} // namespace

std::shared_ptr<Source const> openSource(StorageItem const& container, ArchiveLimits const& limits, Checksums checksums)
{
    std::unique_ptr<ByteStream> stream = container.openReadOnlyStream();
    std::string const access = accessOf(container);
    if (access == randomAccess && checksums == Checksums::Outside)
        readThrough(*stream);
    auto const size = access == sequentialAccess ? std::nullopt : sizeOf(*stream);
    if (size)
        return std::make_shared<StreamSource>(container, std::move(stream), *size);
    return std::make_shared<Spool>(*stream, limits);
}

} // namespace foundation::storage::archive::detail
