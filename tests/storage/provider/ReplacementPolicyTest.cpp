#include <storage/provider/ReplacementPolicy.hpp>

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

static_assert(std::is_same_v<std::underlying_type_t<ReplacementPolicy>, std::int32_t>);
static_assert(!std::is_convertible_v<ReplacementPolicy, int>);
static_assert(static_cast<int>(ReplacementPolicy::Preserve) == 0);
static_assert(static_cast<int>(ReplacementPolicy::Overwrite) == 1);
static_assert(static_cast<int>(ReplacementPolicy::Clobber) == 2);
static_assert(static_cast<int>(ReplacementPolicy::NoClobber) == 3);
static_assert(isDeclared<static_cast<std::ostream& (*)(std::ostream&, ReplacementPolicy)>(&operator<<)>);

TEST(ReplacementPolicy, PrintsTypeAndEnumerator)
{
    EXPECT_EQ(printed(ReplacementPolicy::Preserve), "ReplacementPolicy::Preserve");
    EXPECT_EQ(printed(ReplacementPolicy::Overwrite), "ReplacementPolicy::Overwrite");
    EXPECT_EQ(printed(ReplacementPolicy::Clobber), "ReplacementPolicy::Clobber");
    EXPECT_EQ(printed(ReplacementPolicy::NoClobber), "ReplacementPolicy::NoClobber");
}

TEST(ReplacementPolicy, PrintsNothingForAnyOtherValueAndTheStreamStaysGood)
{
    for (int const value : {-1, 4, 5, 1000}) {
        std::ostringstream stream;
        stream << static_cast<ReplacementPolicy>(value) << "|";
        EXPECT_EQ(stream.str(), "|") << value;
        EXPECT_TRUE(stream.good()) << value;
    }
}

TEST(ReplacementPolicy, PrinterAnswersItsStream)
{
    EXPECT_TRUE(answersItsStream(ReplacementPolicy::Preserve));
    EXPECT_TRUE(answersItsStream(static_cast<ReplacementPolicy>(4)));
}

TEST(ReplacementPolicy, IsPrintedAsOneString)
{
    std::string const text = "ReplacementPolicy::Preserve";
    EXPECT_EQ(printedInField(ReplacementPolicy::Preserve, static_cast<int>(text.size()) + 2), ".." + text);
}

} // namespace
} // namespace foundation::storage::provider
