#include <storage/provider/ExistenceType.hpp>

#include <tests/support/printed.hpp>

#include <gtest/gtest.h>

#include <cstdint>
#include <ios>
#include <ostream>
#include <sstream>
#include <type_traits>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;

static_assert(std::is_same_v<std::underlying_type_t<ExistenceType>, std::int32_t>);
static_assert(std::is_same_v<std::underlying_type_t<ExistenceTypeExtended>, std::int32_t>);
static_assert(!std::is_convertible_v<ExistenceType, int> && !std::is_convertible_v<ExistenceTypeExtended, int>);
static_assert(static_cast<int>(ExistenceType::AsFile) == 0);
static_assert(static_cast<int>(ExistenceType::AsFolder) == 1);
static_assert(static_cast<int>(ExistenceType::AsNeither) == 2);
static_assert(static_cast<int>(ExistenceTypeExtended::RegularFile) == 0);
static_assert(static_cast<int>(ExistenceTypeExtended::SpecialFile) == 1);
static_assert(static_cast<int>(ExistenceTypeExtended::RegularFolder) == 2);
static_assert(static_cast<int>(ExistenceTypeExtended::SymlinkToFile) == 3);
static_assert(static_cast<int>(ExistenceTypeExtended::SymlinkToFolder) == 4);
static_assert(static_cast<int>(ExistenceTypeExtended::BrokenSymlink) == 5);
static_assert(static_cast<int>(ExistenceTypeExtended::None) == 6);
static_assert(isDeclared<static_cast<std::ostream& (*)(std::ostream&, ExistenceType const&)>(&operator<<)>);
static_assert(isDeclared<static_cast<std::ostream& (*)(std::ostream&, ExistenceTypeExtended const&)>(&operator<<)>);

TEST(ExistenceType, PrintsTheBareEnumerator)
{
    EXPECT_EQ(printed(ExistenceType::AsFile), "AsFile");
    EXPECT_EQ(printed(ExistenceType::AsFolder), "AsFolder");
    EXPECT_EQ(printed(ExistenceType::AsNeither), "AsNeither");
}

TEST(ExistenceType, AnyOtherValueSetsFailbitAndNothingMoreIsWritten)
{
    for (int const value : {-1, 3, 1000}) {
        std::ostringstream stream;
        stream << "before" << static_cast<ExistenceType>(value) << "after";
        EXPECT_EQ(stream.rdstate(), std::ios_base::failbit) << value;
        EXPECT_EQ(stream.str(), "before") << value;
    }
}

TEST(ExistenceType, AnyOtherValueThrowsOnAStreamThatThrowsOnFailure)
{
    std::ostringstream stream;
    stream.exceptions(std::ios_base::failbit);
    EXPECT_THROW(stream << static_cast<ExistenceType>(3), std::ios_base::failure);
}

TEST(ExistenceType, PrinterAnswersItsStream)
{
    EXPECT_TRUE(answersItsStream(ExistenceType::AsFile));
    EXPECT_TRUE(answersItsStream(static_cast<ExistenceType>(3)));
}

TEST(ExistenceType, IsPrintedAsOneString)
{
    EXPECT_EQ(printedInField(ExistenceType::AsFile, 8), "..AsFile");
    EXPECT_EQ(printedInField(ExistenceTypeExtended::None, 6), "..None");
}

TEST(ExistenceTypeExtended, PrintsTheBareEnumerator)
{
    EXPECT_EQ(printed(ExistenceTypeExtended::RegularFile), "RegularFile");
    EXPECT_EQ(printed(ExistenceTypeExtended::SpecialFile), "SpecialFile");
    EXPECT_EQ(printed(ExistenceTypeExtended::RegularFolder), "RegularFolder");
    EXPECT_EQ(printed(ExistenceTypeExtended::SymlinkToFile), "SymlinkToFile");
    EXPECT_EQ(printed(ExistenceTypeExtended::SymlinkToFolder), "SymlinkToFolder");
    EXPECT_EQ(printed(ExistenceTypeExtended::BrokenSymlink), "BrokenSymlink");
    EXPECT_EQ(printed(ExistenceTypeExtended::None), "None");
}

TEST(ExistenceTypeExtended, AnyOtherValuePrintsNothingAndTheStreamStaysGood)
{
    for (int const value : {-1, 7, 1000}) {
        std::ostringstream stream;
        stream << static_cast<ExistenceTypeExtended>(value) << "|";
        EXPECT_EQ(stream.str(), "|") << value;
        EXPECT_TRUE(stream.good()) << value;
    }
}

TEST(ExistenceTypeExtended, PrinterAnswersItsStream)
{
    EXPECT_TRUE(answersItsStream(ExistenceTypeExtended::BrokenSymlink));
    EXPECT_TRUE(answersItsStream(static_cast<ExistenceTypeExtended>(7)));
}

} // namespace
} // namespace foundation::storage::provider
