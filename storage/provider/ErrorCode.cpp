#include <storage/provider/ErrorCode.hpp>

#include <ostream>
#include <string_view>

namespace foundation::storage::provider {

namespace {

std::string_view nameOf(ErrorCode code)
{
    switch (code) {
    case ErrorCode::FolderNotEmpty:
        return "ErrorCode::FolderNotEmpty";
    case ErrorCode::InvalidLocation:
        return "ErrorCode::InvalidLocation";
    case ErrorCode::PermissionDenied:
        return "ErrorCode::PermissionDenied";
    case ErrorCode::ResourceAlreadyExists:
        return "ErrorCode::ResourceAlreadyExists";
    case ErrorCode::ResourceNotFound:
        return "ErrorCode::ResourceNotFound";
    case ErrorCode::FileTooLarge:
        return "ErrorCode::FileTooLarge";
    case ErrorCode::ResourceInUse:
        return "ErrorCode::ResourceInUse";
    case ErrorCode::ReadOnlyProvider:
        return "ErrorCode::ReadOnlyProvider";
    case ErrorCode::NoSpaceLeft:
        return "ErrorCode::NoSpaceLeft";
    case ErrorCode::IOError:
        return "ErrorCode::IOError";
    case ErrorCode::InternalError:
        return "ErrorCode::InternalError";
    case ErrorCode::UnsupportedOperation:
        return "ErrorCode::UnsupportedOperation";
    case ErrorCode::Unknown:
        return "ErrorCode::Unknown";
    }
    return "Unhandled ErrorCode";
}

} // namespace

std::string toString(ErrorCode code)
{
    return std::string(nameOf(code));
}

std::ostream& operator<<(std::ostream& stream, ErrorCode const& code)
{
    return stream << nameOf(code);
}

} // namespace foundation::storage::provider
