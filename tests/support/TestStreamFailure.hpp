#pragma once

#include <storage/provider/ByteStreamFailure.hpp>

#include <string>
#include <system_error>

namespace foundation::tests::support {

/// A stream failure with any code.
class TestStreamFailure final : public storage::provider::ByteStreamFailure
{
public:
    explicit TestStreamFailure(storage::provider::ErrorCode code, std::string const& message = "test failure")
        : ByteStreamFailure(message, std::make_error_code(std::errc::io_error), code)
    {}

    core::except::IException* clone() const override { return new TestStreamFailure(*this); }
    [[noreturn]] void rethrow() const override { throw TestStreamFailure(*this); }
};

} // namespace foundation::tests::support
