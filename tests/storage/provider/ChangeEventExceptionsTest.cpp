#include <storage/provider/ChangeEventExceptions.hpp>

#include <storage/provider/Exception.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/locationWithText.hpp>
#include <tests/support/slotOf.hpp>

#include <boost/exception/diagnostic_information.hpp>
#include <boost/exception/get_error_info.hpp>

#include <gtest/gtest.h>

#include <memory>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <typeinfo>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;
using core::except::IException;
using AttemptInfo = boost::error_info<struct TagAttempt, int>;
using NotSupported = ChangeEventsNotSupportedException;
using Subscription = ChangeEventsSubscriptionException;

StorageIRI const somewhere(u"s://h/a/b");

template <class Error>
struct NameOf;

template <>
struct NameOf<NotSupported>
{
    static constexpr char const* value = "foundation::storage::provider::ChangeEventsNotSupportedException";
    static constexpr char16_t const* wide = u"foundation::storage::provider::ChangeEventsNotSupportedException";
};

template <>
struct NameOf<Subscription>
{
    static constexpr char const* value = "foundation::storage::provider::ChangeEventsSubscriptionException";
    static constexpr char16_t const* wide = u"foundation::storage::provider::ChangeEventsSubscriptionException";
};

template <class Error>
concept HasErrorCode = requires(Error const& error)
{
    error.getErrorCode();
};

template <class Error>
class ChangeEventExceptions : public testing::Test
{
    static_assert(std::is_base_of_v<core::except::Exception<core::except::IInternalException, std::exception, void>, //
                                    Error>);
    static_assert(!std::is_base_of_v<Exception, Error>);
    static_assert(!std::is_convertible_v<StorageIRI, Error>);
    static_assert(!HasErrorCode<Error>);
    static_assert(std::is_same_v<decltype(&Error::getStorageIRI), StorageIRI (Error::*)() const>);
};

using Errors = testing::Types<NotSupported, Subscription>;
TYPED_TEST_SUITE(ChangeEventExceptions, Errors);

TYPED_TEST(ChangeEventExceptions, LocationIsThatGiven)
{
    EXPECT_EQ(TypeParam(somewhere).getStorageIRI(), somewhere);
}

TYPED_TEST(ChangeEventExceptions, LocationIsTheOnlyEntry)
{
    TypeParam const error(somewhere);
    ASSERT_NE(boost::get_error_info<StorageIRIInfo>(error), nullptr);
    EXPECT_EQ(*boost::get_error_info<StorageIRIInfo>(error), somewhere);
    EXPECT_EQ(boost::get_error_info<ErrorCodeInfo>(error), nullptr);
    EXPECT_EQ(boost::get_error_info<boost::throw_line>(error), nullptr);
}

TYPED_TEST(ChangeEventExceptions, WhatIsTheClassNameAlone)
{
    TypeParam const error(somewhere);
    EXPECT_STREQ(error.what(), NameOf<TypeParam>::value);
    EXPECT_STREQ(static_cast<std::exception const&>(error).what(), NameOf<TypeParam>::value);
    EXPECT_STREQ(static_cast<IException const&>(error).what(), NameOf<TypeParam>::value);
}

TYPED_TEST(ChangeEventExceptions, TextNamesTheLocationAsItIs)
{
    std::u16string const name = NameOf<TypeParam>::wide;
    EXPECT_EQ(TypeParam(locationWithText(u"a/b")).ToUstringImpl(), name + u"{StorageIRI=\"a/b\"}");
    EXPECT_EQ(TypeParam(locationWithText(u"\"\u00E9")).ToUstringImpl(), name + u"{StorageIRI=\"\"\u00E9\"}");
}

TYPED_TEST(ChangeEventExceptions, CloneSharesItsEntries)
{
    TypeParam const error(somewhere);
    std::unique_ptr<IException> const copy(error.clone());
    IException const& cloned = *copy;
    ASSERT_EQ(typeid(cloned), typeid(TypeParam));
    EXPECT_EQ(dynamic_cast<TypeParam const&>(*copy).getStorageIRI(), somewhere);
    *copy << AttemptInfo(2);
    EXPECT_EQ(*boost::get_error_info<AttemptInfo>(error), 2);
}

TYPED_TEST(ChangeEventExceptions, RethrowThrowsTheDynamicTypeThatSharesItsEntries)
{
    TypeParam const error(somewhere);
    IException const& interface = error;
    try {
        interface.rethrow();
        FAIL() << "nothing was thrown";
    } catch (TypeParam const& thrown) {
        EXPECT_EQ(typeid(thrown), typeid(TypeParam));
        EXPECT_EQ(thrown.getStorageIRI(), somewhere);
        thrown << AttemptInfo(3);
    }
    EXPECT_EQ(*boost::get_error_info<AttemptInfo>(error), 3);
}

TYPED_TEST(ChangeEventExceptions, LostLocationIsNotMadeUp)
{
    struct WithoutEntries : boost::exception
    {};
    TypeParam error(somewhere);
    static_cast<boost::exception&>(error) = WithoutEntries();
    EXPECT_THROW(error.getStorageIRI(), std::logic_error);
    EXPECT_THROW(error.ToUstringImpl(), std::logic_error);
    EXPECT_STREQ(error.what(), NameOf<TypeParam>::value);
}

TYPED_TEST(ChangeEventExceptions, DiagnosticInformationNamesTypeAndLocation)
{
    std::string const information = boost::diagnostic_information(TypeParam(somewhere));
    EXPECT_NE(information.find(NameOf<TypeParam>::value), std::string::npos) << information;
    EXPECT_NE(information.find("s://h/a/b"), std::string::npos) << information;
}

TYPED_TEST(ChangeEventExceptions, VirtualFunctionsStandInTheOrderOfTheInterface)
{
    EXPECT_EQ(slotOf(&TypeParam::clone), 0u);
    EXPECT_EQ(slotOf(&TypeParam::rethrow), 1u);
    EXPECT_EQ(slotOf(&TypeParam::what), 4u);
    EXPECT_EQ(slotOf(&TypeParam::ToUstringImpl), 7u);
    EXPECT_FALSE(isVirtual(&TypeParam::getStorageIRI));
}

TEST(ChangeEventsNotSupportedException, IsCaughtByTypeWhenTheLibraryThrowsIt)
{
    MinimalProvider const provider;
    EXPECT_THROW(provider.publishFolderEventsFor(somewhere, {}, {}), ChangeEventsNotSupportedException);
}

} // namespace
} // namespace foundation::storage::provider
