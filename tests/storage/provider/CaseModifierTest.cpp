#include <storage/provider/CaseModifier.hpp>

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

static_assert(std::is_same_v<std::underlying_type_t<CaseModifier>, std::int32_t>);
static_assert(!std::is_convertible_v<CaseModifier, int>);
static_assert(static_cast<int>(CaseModifier::None) == 0);
static_assert(static_cast<int>(CaseModifier::Sensitive) == 1);
static_assert(static_cast<int>(CaseModifier::InSensitive) == 2);
static_assert(isDeclared<static_cast<std::ostream& (*)(std::ostream&, CaseModifier)>(&operator<<)>);

TEST(CaseModifier, PrintsTypeAndEnumerator)
{
    EXPECT_EQ(printed(CaseModifier::None), "CaseModifier::None");
    EXPECT_EQ(printed(CaseModifier::Sensitive), "CaseModifier::Sensitive");
    EXPECT_EQ(printed(CaseModifier::InSensitive), "CaseModifier::InSensitive");
}

TEST(CaseModifier, PrintsNothingForAnyOtherValueAndTheStreamStaysGood)
{
    for (int const value : {-1, 3, 4, 1000}) {
        std::ostringstream stream;
        stream << static_cast<CaseModifier>(value) << "|";
        EXPECT_EQ(stream.str(), "|") << value;
        EXPECT_TRUE(stream.good()) << value;
    }
}

TEST(CaseModifier, PrinterAnswersItsStream)
{
    EXPECT_TRUE(answersItsStream(CaseModifier::None));
    EXPECT_TRUE(answersItsStream(static_cast<CaseModifier>(3)));
}

TEST(CaseModifier, IsPrintedAsOneString)
{
    std::string const text = "CaseModifier::None";
    EXPECT_EQ(printedInField(CaseModifier::None, static_cast<int>(text.size()) + 2), ".." + text);
}

} // namespace
} // namespace foundation::storage::provider
