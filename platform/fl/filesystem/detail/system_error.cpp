#include <fl/filesystem/detail/system_error.hpp>

#include <cerrno>

#include <fl/filesystem/exceptions.hpp>

namespace fl::filesystem::detail {

void throw_system_error(int error, std::string const& message)
{
    switch (error) {
    case EACCES:
    case EPERM:
        throw AccessDenied(message);
    case ENOENT:
    case ENOTDIR:
        throw PathNotFound(message);
    case EINVAL:
    case ENAMETOOLONG:
    case ELOOP:
        throw InvalidArgument(message);
    default:
        throw SystemError(message);
    }
}

} // namespace fl::filesystem::detail
