#include <storage/provider/StreamClosePolicy.hpp>

#include <tests/support/printed.hpp>

#include <gtest/gtest.h>

#include <cstdint>
#include <ostream>
#include <sstream>
#include <string>
#include <type_traits>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;

static_assert(std::is_same_v<std::underlying_type_t<StreamClosePolicy>, std::int32_t>);
static_assert(!std::is_convertible_v<StreamClosePolicy, int>);
static_assert(static_cast<int>(StreamClosePolicy::Commit) == 0);
static_assert(static_cast<int>(StreamClosePolicy::Abort) == 1);
static_assert(isDeclared<static_cast<std::ostream& (*)(std::ostream&, StreamClosePolicy const&)>(&operator<<)>);

TEST(StreamClosePolicy, PrintsTypeAndEnumerator)
{
    EXPECT_EQ(printed(StreamClosePolicy::Commit), "StreamClosePolicy::Commit");
    EXPECT_EQ(printed(StreamClosePolicy::Abort), "StreamClosePolicy::Abort");
}

TEST(StreamClosePolicy, PrintsNothingForAnyOtherValueAndTheStreamStaysGood)
{
    for (int const value : {-1, 2, 3, 1000}) {
        std::ostringstream stream;
        stream << static_cast<StreamClosePolicy>(value) << "|";
        EXPECT_EQ(stream.str(), "|") << value;
        EXPECT_TRUE(stream.good()) << value;
    }
}

TEST(StreamClosePolicy, PrinterAnswersItsStream)
{
    EXPECT_TRUE(answersItsStream(StreamClosePolicy::Commit));
    EXPECT_TRUE(answersItsStream(static_cast<StreamClosePolicy>(2)));
}

TEST(StreamClosePolicy, IsPrintedAsOneString)
{
    std::string const text = "StreamClosePolicy::Commit";
    EXPECT_EQ(printedInField(StreamClosePolicy::Commit, static_cast<int>(text.size()) + 2), ".." + text);
}

} // namespace
} // namespace foundation::storage::provider
