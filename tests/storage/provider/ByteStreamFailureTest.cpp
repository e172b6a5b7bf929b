#include <storage/provider/ByteStreamFailure.hpp>

#include <storage/provider/detail/SafeByteStream.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/TestStreamFailure.hpp>
#include <tests/support/slotOf.hpp>

#include <boost/exception/diagnostic_information.hpp>
#include <boost/exception/get_error_info.hpp>
#include <boost/exception/info.hpp>

#include <gtest/gtest.h>

#include <ios>
#include <memory>
#include <string>
#include <system_error>
#include <type_traits>
#include <typeinfo>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;
using core::except::IException;
using core::except::IInternalException;
using AttemptInfo = boost::error_info<struct TagAttempt, int>;

static_assert(std::is_abstract_v<ByteStreamFailure>);
static_assert(std::is_base_of_v<IInternalException, ByteStreamFailure>);
static_assert(std::is_base_of_v<std::ios_base::failure, ByteStreamFailure>);
static_assert(!std::is_constructible_v<ByteStreamFailure, std::string const&, std::error_code const&, ErrorCode>);
static_assert(std::is_same_v<decltype(&ByteStreamFailure::getErrorCode), ErrorCode (ByteStreamFailure::*)() const>);
static_assert(std::is_same_v<decltype(&ByteStreamFailure::what), char const* (ByteStreamFailure::*)() const noexcept>);
static_assert(std::is_base_of_v<ByteStreamFailure, ByteStreamWriteFailure>);
static_assert(std::is_default_constructible_v<ByteStreamWriteFailure>);
static_assert(sizeof(ByteStreamWriteFailure) == sizeof(ByteStreamFailure));
static_assert(std::is_same_v<decltype(&ByteStreamWriteFailure::clone), //
                             IException* (ByteStreamWriteFailure::*)() const>);
static_assert(std::is_same_v<decltype(&ByteStreamWriteFailure::rethrow), void (ByteStreamWriteFailure::*)() const>);

// A failure that says what the class itself says.
std::string standardText(std::string const& message, std::error_code const& error)
{
    return std::ios_base::failure(message, error).what();
}

TEST(ByteStreamFailure, CarriesTheCodeGiven)
{
    EXPECT_EQ(TestStreamFailure(ErrorCode::NoSpaceLeft).getErrorCode(), ErrorCode::NoSpaceLeft);
    EXPECT_EQ(TestStreamFailure(static_cast<ErrorCode>(13)).getErrorCode(), static_cast<ErrorCode>(13));
}

TEST(ByteStreamFailure, WhatIsThatOfTheStandardFailure)
{
    TestStreamFailure const failure(ErrorCode::IOError, "disk on fire");
    std::string const expected = standardText("disk on fire", std::make_error_code(std::errc::io_error));
    EXPECT_EQ(failure.what(), expected);
    EXPECT_EQ(static_cast<IException const&>(failure).what(), expected);
    EXPECT_EQ(static_cast<std::exception const&>(failure).what(), expected);
}

TEST(ByteStreamFailure, WhatKeepsBytesThatAreNotUtf8)
{
    TestStreamFailure const failure(ErrorCode::IOError, "caf\xE9");
    EXPECT_EQ(failure.what(), standardText("caf\xE9", std::make_error_code(std::errc::io_error)));
}

TEST(ByteStreamFailure, TextIsWhatInUtf16)
{
    TestStreamFailure const failure(ErrorCode::IOError, "caf\xC3\xA9 \xFF");
    EXPECT_EQ(failure.ToUstringImpl().find(u"caf\u00E9 \uFFFD"), 0u);
}

TEST(ByteStreamFailure, AddsItsCodeAfterTheSlotsOfTheInterface)
{
    EXPECT_EQ(slotOf(&ByteStreamFailure::clone), 0u);
    EXPECT_EQ(slotOf(&ByteStreamFailure::rethrow), 1u);
    EXPECT_EQ(slotOf(&ByteStreamFailure::what), 4u);
    EXPECT_EQ(slotOf(&ByteStreamFailure::ToUstringImpl), 7u);
    EXPECT_TRUE(isVirtual(&ByteStreamFailure::getErrorCode));
    EXPECT_EQ(slotOf(&ByteStreamFailure::getErrorCode), 8u);
}

TEST(ByteStreamFailure, InterfaceIsTheFirstBaseAndTheStandardFailureTheSecond)
{
    TestStreamFailure const failure(ErrorCode::IOError);
    auto const address = [](auto const* part) { return static_cast<void const*>(part); };
    EXPECT_EQ(address(static_cast<IException const*>(&failure)), address(&failure));
    EXPECT_LT(address(&failure), address(static_cast<std::ios_base::failure const*>(&failure)));
}

TEST(ByteStreamWriteFailure, HasItsMessageAndItsCodes)
{
    ByteStreamWriteFailure const failure;
    EXPECT_EQ(failure.what(), standardText("Stream was not opened for writing.", std::io_errc::stream));
    EXPECT_EQ(std::string(failure.what()).find("Stream was not opened for writing."), 0u);
    EXPECT_EQ(failure.code(), std::io_errc::stream);
    EXPECT_EQ(failure.code().value(), 1);
    EXPECT_EQ(failure.code().category(), std::iostream_category());
    EXPECT_EQ(failure.getErrorCode(), ErrorCode::IOError);
    EXPECT_EQ(failure.ToUstringImpl().find(u"Stream was not opened for writing."), 0u);
}

TEST(ByteStreamWriteFailure, CloneIsOfTheSameTypeAndSharesItsEntries)
{
    ByteStreamWriteFailure failure;
    failure << AttemptInfo(1);
    std::unique_ptr<IException> const copy(failure.clone());
    IException const& cloned = *copy;
    ASSERT_EQ(typeid(cloned), typeid(ByteStreamWriteFailure));
    EXPECT_EQ(dynamic_cast<ByteStreamWriteFailure const&>(*copy).getErrorCode(), ErrorCode::IOError);
    EXPECT_STREQ(copy->what(), failure.what());
    *copy << AttemptInfo(2);
    EXPECT_EQ(*boost::get_error_info<AttemptInfo>(failure), 2);
}

TEST(ByteStreamWriteFailure, IsCaughtByEachOfItsBases)
{
    ByteStreamWriteFailure const failure;
    EXPECT_THROW(failure.rethrow(), ByteStreamWriteFailure);
    EXPECT_THROW(failure.rethrow(), ByteStreamFailure);
    EXPECT_THROW(failure.rethrow(), std::ios_base::failure);
    EXPECT_THROW(failure.rethrow(), std::system_error);
    EXPECT_THROW(failure.rethrow(), std::exception);
    EXPECT_THROW(failure.rethrow(), IInternalException);
    EXPECT_THROW(failure.rethrow(), boost::exception);
}

TEST(ByteStreamWriteFailure, IsCaughtAsAStandardFailureWhenTheLibraryThrowsIt)
{
    detail::SafeByteStream stream(std::make_unique<RecordingByteStream>(), true, false);
    try {
        stream.write("x", 1);
        FAIL() << "nothing was thrown";
    } catch (std::ios_base::failure const& thrown) {
        EXPECT_EQ(typeid(thrown), typeid(ByteStreamWriteFailure));
        EXPECT_EQ(dynamic_cast<ByteStreamFailure const&>(thrown).getErrorCode(), ErrorCode::IOError);
    }
}

TEST(ByteStreamWriteFailure, DiagnosticInformationSaysTheMessage)
{
    std::string const information = boost::diagnostic_information(ByteStreamWriteFailure());
    EXPECT_NE(information.find("Stream was not opened for writing."), std::string::npos) << information;
}

} // namespace
} // namespace foundation::storage::provider
