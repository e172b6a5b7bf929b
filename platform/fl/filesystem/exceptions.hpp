#pragma once

#include <exception>
#include <stdexcept>
#include <string>

#include <foundation/export.hpp>

/// The failures of the path library. The four kinds derive virtually from `FsysExceptionBase`, so that a class that is
/// two of them at once is still caught as one `FsysExceptionBase`; such a class names the message for the base itself.
namespace fl::filesystem {

/// Any failure of the path library.
class FOUNDATION_API FsysExceptionBase : public std::exception
{
public:
    explicit FsysExceptionBase(std::string const& message);
    ~FsysExceptionBase() noexcept override;

    [[nodiscard]] char const* what() const noexcept override;

private:
    // Shares its text between copies, which therefore never throw.
    std::runtime_error message_;
};

/// The rights do not suffice.
class FOUNDATION_API AccessDenied : public virtual FsysExceptionBase
{
public:
    explicit AccessDenied(std::string const& message);
    ~AccessDenied() noexcept override;
};

/// The operating system failed in a way that has no name of its own here.
class FOUNDATION_API SystemError : public virtual FsysExceptionBase
{
public:
    explicit SystemError(std::string const& message);
    ~SystemError() noexcept override;
};

/// There is nothing at the path, or something on the way to it is not a folder.
class FOUNDATION_API PathNotFound : public virtual FsysExceptionBase
{
public:
    explicit PathNotFound(std::string const& message);
    ~PathNotFound() noexcept override;
};

/// The path cannot be one of this system, or leads in circles.
class FOUNDATION_API InvalidArgument : public virtual FsysExceptionBase
{
public:
    explicit InvalidArgument(std::string const& message);
    ~InvalidArgument() noexcept override;
};

} // namespace fl::filesystem
