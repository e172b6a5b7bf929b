#include <storage/provider/Conversions.hpp>

#include <fl/filesystem/exceptions.hpp>
#include <fl/filesystem/path_functions.hpp>
#include <fl/filesystem/volume.hpp>
#include <foundation/ustring.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/detail/canonicalize.hpp>

#include <boost/exception/current_exception_cast.hpp>
#include <boost/exception/diagnostic_information.hpp>

#include <exception>
#include <sstream>
#include <stdexcept>
#include <string>

namespace foundation::storage::provider {

namespace {

namespace fs = fl::filesystem;

bool isAbsolute(fs::upath const& path)
{
    return fs::detail::make_generic_form(path.string()).starts_with(u'/') || fs::detail::is_absolute(path.string());
}

[[noreturn]] void throwNotAbsolute(fs::upath const& path)
{
    std::ostringstream message;
    ustring::insert(message << "File path ", path.string()) << " is not absolute.";
    throw std::runtime_error(message.str());
}

template <class Failure>
bool is(fs::FsysExceptionBase const& failure)
{
    return dynamic_cast<Failure const*>(&failure) != nullptr;
}

/// Of a failure that is of two kinds, the first in this order counts.
ErrorCode codeOf(fs::FsysExceptionBase const& failure)
{
    return is<fs::AccessDenied>(failure)      ? ErrorCode::PermissionDenied
           : is<fs::SystemError>(failure)     ? ErrorCode::IOError
           : is<fs::PathNotFound>(failure)    ? ErrorCode::ResourceNotFound
           : is<fs::InvalidArgument>(failure) ? ErrorCode::InvalidLocation
                                              : ErrorCode::Unknown;
}

/// Boost describes an exception of any type; here one that is neither its own nor a standard one says nothing.
std::string describeCurrentException()
{
    if (boost::current_exception_cast<boost::exception const>() == nullptr &&
        boost::current_exception_cast<std::exception const>() == nullptr)
        return "No diagnostic information available.";
    return boost::current_exception_diagnostic_information(true);
}

} // namespace

StorageIRI toStorageIRI(std::u16string const& scheme, fs::upath const& path)
{
    if (!path.string().empty() && !isAbsolute(path))
        throwNotAbsolute(path);
    return StorageIRI(scheme, path);
}

StorageIRI detail::toCanonicalizedStorageIRI(std::u16string const& scheme, fs::upath const& path,
                                             Canonicalize const& canonicalize)
{
    try {
        return toStorageIRI(scheme, canonicalize(path));
    } catch (fs::FsysExceptionBase const& failure) {
        throw Exception(codeOf(failure), toStorageIRI(scheme, path));
    } catch (...) {
        throw std::runtime_error(describeCurrentException());
    }
}

StorageIRI toCanonicalizedStorageIRI(std::u16string const& scheme, fs::upath const& path)
{
    return detail::toCanonicalizedStorageIRI(
        scheme, path, [](fs::upath const& given) { return fs::get_pathname_from_volume(given, fs::upath()); });
}

fs::upath fromStorageIRI(StorageIRI const& iri)
{
    return iri.toUPath();
}

} // namespace foundation::storage::provider
