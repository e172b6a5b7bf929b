#include <fl/filesystem/exceptions.hpp>

namespace fl::filesystem {

FsysExceptionBase::FsysExceptionBase(std::string const& message) : message_(message) {}
FsysExceptionBase::~FsysExceptionBase() noexcept = default;
char const* FsysExceptionBase::what() const noexcept
{
    return message_.what();
}

AccessDenied::AccessDenied(std::string const& message) : FsysExceptionBase(message) {}
AccessDenied::~AccessDenied() noexcept = default;

SystemError::SystemError(std::string const& message) : FsysExceptionBase(message) {}
SystemError::~SystemError() noexcept = default;

PathNotFound::PathNotFound(std::string const& message) : FsysExceptionBase(message) {}
PathNotFound::~PathNotFound() noexcept = default;

InvalidArgument::InvalidArgument(std::string const& message) : FsysExceptionBase(message) {}
InvalidArgument::~InvalidArgument() noexcept = default;

} // namespace fl::filesystem
