#include <storage/provider/ErrorCode.hpp>

#include <tests/support/printed.hpp>

#include <gtest/gtest.h>

#include <cstdint>
#include <limits>
#include <ostream>
#include <string>
#include <type_traits>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;

static_assert(std::is_same_v<std::underlying_type_t<ErrorCode>, std::int32_t>);
static_assert(!std::is_convertible_v<ErrorCode, int>);
static_assert(isDeclared<static_cast<std::ostream& (*)(std::ostream&, ErrorCode const&)>(&operator<<)>);
static_assert(isDeclared<static_cast<std::string (*)(ErrorCode)>(&toString)>);

struct Row
{
    ErrorCode code;
    int value;
    char const* text;
};

constexpr Row rows[] = {
    {ErrorCode::FolderNotEmpty, 0, "ErrorCode::FolderNotEmpty"},
    {ErrorCode::InvalidLocation, 1, "ErrorCode::InvalidLocation"},
    {ErrorCode::PermissionDenied, 2, "ErrorCode::PermissionDenied"},
    {ErrorCode::ResourceAlreadyExists, 3, "ErrorCode::ResourceAlreadyExists"},
    {ErrorCode::ResourceNotFound, 4, "ErrorCode::ResourceNotFound"},
    {ErrorCode::FileTooLarge, 5, "ErrorCode::FileTooLarge"},
    {ErrorCode::ResourceInUse, 6, "ErrorCode::ResourceInUse"},
    {ErrorCode::ReadOnlyProvider, 7, "ErrorCode::ReadOnlyProvider"},
    {ErrorCode::NoSpaceLeft, 8, "ErrorCode::NoSpaceLeft"},
    {ErrorCode::IOError, 9, "ErrorCode::IOError"},
    {ErrorCode::InternalError, 10, "ErrorCode::InternalError"},
    {ErrorCode::UnsupportedOperation, 11, "ErrorCode::UnsupportedOperation"},
    {ErrorCode::Unknown, 12, "ErrorCode::Unknown"},
    {static_cast<ErrorCode>(13), 13, "Unhandled ErrorCode"},
    {static_cast<ErrorCode>(-1), -1, "Unhandled ErrorCode"},
    {static_cast<ErrorCode>(std::numeric_limits<int>::max()), std::numeric_limits<int>::max(), "Unhandled ErrorCode"},
};

TEST(ErrorCode, EveryEnumeratorHasItsValue)
{
    for (Row const& row : rows)
        EXPECT_EQ(static_cast<int>(row.code), row.value) << row.text;
}

TEST(ErrorCode, TextAndPrinterAgreeForEveryValue)
{
    for (Row const& row : rows) {
        EXPECT_EQ(toString(row.code), row.text);
        EXPECT_EQ(printed(row.code), row.text);
    }
}

TEST(ErrorCode, PrinterAnswersItsStream)
{
    EXPECT_TRUE(answersItsStream(ErrorCode::IOError));
    EXPECT_TRUE(answersItsStream(static_cast<ErrorCode>(13)));
}

TEST(ErrorCode, IsPrintedAsOneString)
{
    EXPECT_EQ(printedInField(ErrorCode::IOError, 20), "..ErrorCode::IOError");
}

} // namespace
} // namespace foundation::storage::provider
