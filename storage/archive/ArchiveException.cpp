#include <storage/archive/ArchiveException.hpp>

#include <fl/i18n/convert.hpp>
#include <storage/provider/ReasonInfo.hpp>

#include <array>
#include <ostream>
#include <string>

namespace foundation::storage::archive {

using provider::ErrorCode;
using provider::StorageIRI;
using Reason = ArchiveException::Reason;

namespace {

struct Row
{
    Reason reason;
    ErrorCode code;
    char const* name;
    char const* words;
};

constexpr std::array rows{
    Row{Reason::NotAnArchive, ErrorCode::IOError, "NotAnArchive",
        "not an archive of this format, or its end is missing"},
    Row{Reason::Damaged, ErrorCode::IOError, "Damaged",
        "damaged: it breaks off, contradicts itself, or does not match its checksum"},
    Row{Reason::Changed, ErrorCode::IOError, "Changed", "the archive was changed while it was in use"},
    Row{Reason::Encrypted, ErrorCode::PermissionDenied, "Encrypted", "encrypted"},
    Row{Reason::UnsupportedMethod, ErrorCode::UnsupportedOperation, "UnsupportedMethod",
        "the archive stores it in a way that is not supported"},
    Row{Reason::TooManyEntries, ErrorCode::FileTooLarge, "TooManyEntries",
        "the archive holds more entries than allowed"},
    Row{Reason::IndexTooLarge, ErrorCode::FileTooLarge, "IndexTooLarge",
        "the names in the archive take more memory than allowed"},
    Row{Reason::NestedTooDeep, ErrorCode::InvalidLocation, "NestedTooDeep",
        "archives lie within each other more deeply than allowed"},
    Row{Reason::EntryTooLarge, ErrorCode::FileTooLarge, "EntryTooLarge", "the content is larger than allowed"},
    Row{Reason::RatioTooHigh, ErrorCode::FileTooLarge, "RatioTooHigh",
        "the content is compressed more highly than allowed, as in an archive made to do harm"},
    Row{Reason::SpoolTooLarge, ErrorCode::FileTooLarge, "SpoolTooLarge",
        "the archive would have to be unpacked from another one, and is larger than allowed for that"},
    Row{Reason::NotWritten, ErrorCode::IOError, "NotWritten", "the archive cannot be written, and stays as it was"},
    Row{Reason::StoreFailed, ErrorCode::IOError, "StoreFailed",
        "reading the archive failed in the store that holds it"},
};

/// Why a store did not take an archive.
char const* describeRefusal(ErrorCode code)
{
    switch (code) {
    case ErrorCode::NoSpaceLeft:
        return "no space left";
    case ErrorCode::PermissionDenied:
        return "permission denied";
    case ErrorCode::ReadOnlyProvider:
        return "the store is read-only";
    case ErrorCode::ResourceNotFound:
        return "there is no folder to hold it";
    case ErrorCode::InvalidLocation:
        return "a name in it is too long";
    default:
        return "the store that holds it failed";
    }
}

std::string wordsFor(Reason reason, ErrorCode code)
{
    std::string words = describe(reason);
    return reason == Reason::NotWritten ? words + ": " + describeRefusal(code) : words;
}

Row const* find(Reason reason)
{
    for (Row const& row : rows) {
        if (row.reason == reason)
            return &row;
    }
    return nullptr;
}

} // namespace

ErrorCode errorCodeOf(Reason reason)
{
    Row const* const row = find(reason);
    return row == nullptr ? ErrorCode::Unknown : row->code;
}

char const* describe(Reason reason)
{
    Row const* const row = find(reason);
    return row == nullptr ? "failed" : row->words;
}

ArchiveException::ArchiveException(Reason reason, StorageIRI const& location)
    : ArchiveException(reason, errorCodeOf(reason), location)
{}

ArchiveException::ArchiveException(Reason reason, ErrorCode code, StorageIRI const& location)
    : Exception(code, location), reason_(reason)
{
    *this << provider::ReasonInfo(fl::i18n::to_ustring(wordsFor(reason, code)));
}

core::except::IException* ArchiveException::clone() const
{
    return new ArchiveException(*this);
}

void ArchiveException::rethrow() const
{
    throw ArchiveException(*this);
}

char const* ArchiveException::what() const noexcept
{
    return "foundation::storage::archive::ArchiveException";
}

std::u16string ArchiveException::ToUstringImpl() const
{
    char16_t const* const attempt = reason_ == Reason::NotWritten ? u"write" : u"read";
    return std::u16string(u"Cannot ") + attempt + u" \"" + getStorageIRI().toString() + u"\": " +
           fl::i18n::to_ustring(wordsFor(reason_, getErrorCode())) + u'.';
}

std::ostream& operator<<(std::ostream& stream, Reason const& reason)
{
    Row const* const row = find(reason);
    return row == nullptr ? stream << "Unhandled Reason" : stream << "Reason::" << row->name;
}

} // namespace foundation::storage::archive
