#include <tools/storage/describe.hpp>

#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/ChangeEventExceptions.hpp>
#include <storage/provider/Exception.hpp>
#include <tools/storage/explain.hpp>

#include <exception>
#include <new>

namespace foundation::storage::tool {

char const* describe(provider::ErrorCode code)
{
    using provider::ErrorCode;
    switch (code) {
    case ErrorCode::FolderNotEmpty:
        return "the folder is not empty";
    case ErrorCode::InvalidLocation:
        return "not a possible location (a name may be too long, or the host is not this one)";
    case ErrorCode::PermissionDenied:
        return "permission denied";
    case ErrorCode::ResourceAlreadyExists:
        return "exists already";
    case ErrorCode::ResourceNotFound:
        return "no such file or folder";
    case ErrorCode::FileTooLarge:
        return "the file is too large for this store";
    case ErrorCode::ResourceInUse:
        return "in use by somebody else";
    case ErrorCode::ReadOnlyProvider:
        return "the store is read-only";
    case ErrorCode::NoSpaceLeft:
        return "no space left";
    case ErrorCode::IOError:
        return "reading or writing failed";
    case ErrorCode::InternalError:
        return "the store failed in a way that it should not (internal error)";
    case ErrorCode::UnsupportedOperation:
        return "the store cannot do this";
    case ErrorCode::Unknown:
        break;
    }
    return "the store failed without saying why";
}

void rethrowAsFailure(Place const& place)
{
    try {
        throw;
    } catch (provider::Exception const& error) {
        throw Failure{place.text(), explain(error)};
    } catch (provider::ByteStreamFailure const& error) {
        throw Failure{place.text(), explain(error)};
    } catch (provider::ChangeEventsNotSupportedException const&) {
        throw Failure{place.text(), "the store does not tell of changes"};
    } catch (provider::ChangeEventsSubscriptionException const&) {
        throw Failure{place.text(), "cannot be watched (it may not be read, or the system is out of watches)"};
    } catch (std::bad_alloc const&) {
        throw;
    } catch (std::exception const& error) {
        throw Failure{place.text(), error.what()};
    }
}

} // namespace foundation::storage::tool
