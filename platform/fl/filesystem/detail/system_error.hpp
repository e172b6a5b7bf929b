#pragma once

#include <string>

#include <foundation/export.hpp>

namespace fl::filesystem::detail {

/// Throws the exception of the path library that belongs to an `errno`.
///
/// Errors: `AccessDenied` for `EACCES` and `EPERM`; `PathNotFound` for `ENOENT` and `ENOTDIR`; `InvalidArgument` for
/// `EINVAL`, `ENAMETOOLONG` and `ELOOP`; `SystemError` for all others.
[[noreturn]] FOUNDATION_API void throw_system_error(int error, std::string const& message);

} // namespace fl::filesystem::detail
