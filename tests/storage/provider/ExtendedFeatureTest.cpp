#include <storage/provider/ExtendedFeature.hpp>

#include <tests/support/printed.hpp>

#include <gtest/gtest.h>

#include <cstdint>
#include <ostream>
#include <sstream>
#include <type_traits>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;

static_assert(std::is_same_v<std::underlying_type_t<ExtendedFeature>, std::int32_t>);
static_assert(!std::is_convertible_v<ExtendedFeature, int>);
static_assert(static_cast<int>(ExtendedFeature::RecursiveFolderRemoval) == 0);
static_assert(static_cast<int>(ExtendedFeature::AtomicFileCopy) == 5);
static_assert(isDeclared<static_cast<std::ostream& (*)(std::ostream&, ExtendedFeature)>(&operator<<)>);

TEST(ExtendedFeature, PrintsRecursiveFolderRemoval)
{
    EXPECT_EQ(printed(ExtendedFeature::RecursiveFolderRemoval), "ExtendedFeature::RecursiveFolderRemoval");
}

TEST(ExtendedFeature, PrintsNothingForAtomicFileCopyAndAnyOtherValueAndTheStreamStaysGood)
{
    for (int const value : {5, -1, 1, 2, 3, 4, 6, 1000}) {
        std::ostringstream stream;
        stream << static_cast<ExtendedFeature>(value) << "|";
        EXPECT_EQ(stream.str(), "|") << value;
        EXPECT_TRUE(stream.good()) << value;
    }
}

TEST(ExtendedFeature, PrinterAnswersItsStream)
{
    EXPECT_TRUE(answersItsStream(ExtendedFeature::RecursiveFolderRemoval));
    EXPECT_TRUE(answersItsStream(ExtendedFeature::AtomicFileCopy));
}

TEST(ExtendedFeature, IsPrintedAsOneString)
{
    EXPECT_EQ(printedInField(ExtendedFeature::RecursiveFolderRemoval, 41), "..ExtendedFeature::RecursiveFolderRemoval");
}

} // namespace
} // namespace foundation::storage::provider
