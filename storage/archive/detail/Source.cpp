#include <storage/archive/detail/Source.hpp>

#include <storage/archive/detail/Spool.hpp>
#include <storage/archive/detail/StreamSource.hpp>

#include <boost/any.hpp>

#include <optional>
#include <string>
#include <utility>

namespace foundation::storage::archive::detail {

using namespace provider;

namespace {

bool isSequential(StorageItem const& file)
{
    ExtendedAttributes const attributes = file.getExtendedAttributes();
    if (!attributes.hasAttribute(accessAttribute))
        return false;
    boost::any const value = attributes.getAttribute(accessAttribute);
    auto const* const access = boost::any_cast<std::string>(&value);
    return access != nullptr && *access == sequentialAccess;
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

std::shared_ptr<Source const> openSource(StorageItem const& container, ArchiveLimits const& limits)
{
    std::unique_ptr<ByteStream> stream = container.openReadOnlyStream();
    auto const size = isSequential(container) ? std::nullopt : sizeOf(*stream);
    if (size)
        return std::make_shared<StreamSource>(container, std::move(stream), *size);
    return std::make_shared<Spool>(*stream, limits);
}

} // namespace foundation::storage::archive::detail
