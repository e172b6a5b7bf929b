#include <storage/provider/ByteStreamFailure.hpp>

namespace foundation::storage::provider {

ByteStreamFailure::ByteStreamFailure(std::string const& message, std::error_code const& error, ErrorCode code)
    : std::ios_base::failure(message, error), code_(code)
{}

char const* ByteStreamFailure::what() const noexcept
{
    return std::ios_base::failure::what();
}

ErrorCode ByteStreamFailure::getErrorCode() const
{
    return code_;
}

ByteStreamWriteFailure::ByteStreamWriteFailure()
    : ByteStreamFailure("Stream was not opened for writing.", std::io_errc::stream, ErrorCode::IOError)
{}

ByteStreamWriteFailure::~ByteStreamWriteFailure() noexcept = default;

core::except::IException* ByteStreamWriteFailure::clone() const
{
    return new ByteStreamWriteFailure(*this);
}

void ByteStreamWriteFailure::rethrow() const
{
    throw ByteStreamWriteFailure(*this);
}

} // namespace foundation::storage::provider
