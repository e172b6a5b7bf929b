#pragma once

#include <foundation/export.hpp>
#include <storage/archive/ArchiveLimits.hpp>
#include <storage/archive/detail/Fault.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/StorageItem.hpp>

#include <cstddef>
#include <cstdint>
#include <memory>

namespace foundation::storage::archive::detail {

/// The bytes of an archive, to be read at any place.
/// Threads: any number at once.
class FOUNDATION_API Source
{
public:
    Source() = default;
    Source(Source const&) = delete;
    Source& operator=(Source const&) = delete;
    virtual ~Source() = default;

    virtual std::uint64_t size() const = 0;

    /// Answers how many bytes it read, which are fewer than `count` only at the end. Throws `Fault`.
    virtual std::size_t readAt(std::uint64_t offset, char* buffer, std::size_t count) const = 0;
};

/// The extended attribute of a file in an archive that says how its content can be read, and its values.
inline constexpr char const* accessAttribute = "archive.access";
inline constexpr char const* randomAccess = "random";
inline constexpr char const* sequentialAccess = "sequential";

/// Where there are checksums of the content of an archive.
enum class Checksums
{
    Inside,
    Outside, ///< if anywhere, round the archive as a whole
};

/// The bytes of a file: through streams of it where they seek well, else through a copy that is made now.
///
/// An archive without checksums that is stored in another one is read through first, as that may have one for it, at
/// which nobody looks who reads here and there.
///
/// Errors: what opening the file throws; `Fault` for what happens to its streams.
FOUNDATION_API std::shared_ptr<Source const> openSource(provider::StorageItem const& container,
                                                        ArchiveLimits const& limits,
                                                        Checksums checksums = Checksums::Inside);

/// Calls `action`, and makes a `Fault` of a failure in the store below.
template <typename Action>
auto inStore(Action const& action)
{
    try {
        return action();
    } catch (provider::ByteStreamFailure const& failure) {
        throw Fault(ArchiveException::Reason::StoreFailed, failure.getErrorCode());
    } catch (provider::Exception const& failure) {
        throw Fault(ArchiveException::Reason::StoreFailed, failure.getErrorCode());
    }
}

} // namespace foundation::storage::archive::detail
