#pragma once

#include <foundation/export.hpp>
#include <storage/provider/Exception.hpp>

#include <iosfwd>
#include <string>

namespace foundation::storage::archive {

/// An archive, or an entry of one, that cannot be read or written.
///
/// The location is the container's where the archive as a whole is at fault, else the entry's. `what` is the class name
/// alone; `ToUstringImpl` names the location and says why, and `ReasonInfo` holds the same words without it.
class FOUNDATION_API ArchiveException : public provider::Exception
{
public:
    enum class Reason
    {
        NotAnArchive,      ///< `IOError`: no archive of this format, or one whose end is missing
        Damaged,           ///< `IOError`: it breaks off, contradicts itself, or does not match its checksum
        Changed,           ///< `IOError`: the container is no longer what it was when its index was read
        Encrypted,         ///< `PermissionDenied`: the content is encrypted
        UnsupportedMethod, ///< `UnsupportedOperation`: a compression, encryption or kind of entry that is not known
        TooManyEntries,    ///< `FileTooLarge`: beyond `ArchiveLimits::entries`
        IndexTooLarge,     ///< `FileTooLarge`: beyond `ArchiveLimits::indexBytes`
        NestedTooDeep,     ///< `InvalidLocation`: beyond `ArchiveLimits::nesting`
        EntryTooLarge,     ///< `FileTooLarge`: beyond `ArchiveLimits::entryBytes`
        RatioTooHigh,      ///< `FileTooLarge`: beyond `ArchiveLimits::ratio`
        SpoolTooLarge,     ///< `FileTooLarge`: beyond `ArchiveLimits::spoolBytes`
        NotWritten,        ///< the code of the store that holds the archive, which is as it was; changes are kept
        StoreFailed,       ///< the code of the store that holds the archive, or of the folder for temporary files
    };

    ArchiveException(Reason reason, provider::StorageIRI const& location);

    /// With a code of its own, for `StoreFailed` and `NotWritten`.
    ArchiveException(Reason reason, provider::ErrorCode code, provider::StorageIRI const& location);

    Reason getReason() const { return reason_; }

    core::except::IException* clone() const override;
    [[noreturn]] void rethrow() const override;
    char const* what() const noexcept override;
    std::u16string ToUstringImpl() const override;

private:
    Reason reason_;
};

/// The code that goes with a reason; `IOError` for `StoreFailed` and `NotWritten`.
FOUNDATION_API provider::ErrorCode errorCodeOf(ArchiveException::Reason reason);

/// What happened, in words that may follow a location.
FOUNDATION_API char const* describe(ArchiveException::Reason reason);

/// Writes "Reason::" and the enumerator, or "Unhandled Reason" for any other value.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, ArchiveException::Reason const& reason);

} // namespace foundation::storage::archive
