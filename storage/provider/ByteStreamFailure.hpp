#pragma once

#include <foundation/core/except/IInternalException.hpp>
#include <foundation/export.hpp>
#include <storage/provider/ErrorCode.hpp>

#include <ios>
#include <string>
#include <system_error>

namespace foundation::storage::provider {

/// A failure of a byte stream, which passes through stream code as the `std::ios_base::failure` that it is.
///
/// A subclass supplies `clone` and `rethrow`.
class FOUNDATION_API ByteStreamFailure : public core::except::IInternalException, public std::ios_base::failure
{
public:
    /// The message given at construction, which the standard library may follow by that of the error code.
    char const* what() const noexcept override;

    virtual ErrorCode getErrorCode() const;

protected:
    ByteStreamFailure(std::string const& message, std::error_code const& error, ErrorCode code);

private:
    ErrorCode code_;
};

/// Something was written to a stream that was opened without write access: "Stream was not opened for writing.",
/// `std::io_errc::stream`, `ErrorCode::IOError`.
class FOUNDATION_API ByteStreamWriteFailure : public ByteStreamFailure
{
public:
    ByteStreamWriteFailure();
    ~ByteStreamWriteFailure() noexcept override;

    core::except::IException* clone() const override;
    [[noreturn]] void rethrow() const override;
};

} // namespace foundation::storage::provider
