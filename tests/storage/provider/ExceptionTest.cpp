#include <storage/provider/Exception.hpp>

#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/ChangeEventExceptions.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/locationWithText.hpp>
#include <tests/support/slotOf.hpp>

#include <boost/exception/diagnostic_information.hpp>
#include <boost/exception/errinfo_errno.hpp>
#include <boost/exception/get_error_info.hpp>

#include <gtest/gtest.h>

#include <ios>
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

static_assert(std::is_empty_v<TagErrorCode> && std::is_empty_v<TagStorageIRI>);
static_assert(std::is_same_v<ErrorCodeInfo, boost::error_info<TagErrorCode, ErrorCode>>);
static_assert(std::is_same_v<StorageIRIInfo, boost::error_info<TagStorageIRI, StorageIRI>>);
static_assert(std::is_base_of_v<core::except::Exception<core::except::IInternalException, std::exception, void>, //
                                Exception>);
static_assert(!std::is_base_of_v<std::ios_base::failure, Exception>);
static_assert(!std::is_base_of_v<std::logic_error, Exception> && !std::is_base_of_v<std::runtime_error, Exception>);
static_assert(!std::is_default_constructible_v<Exception>);
static_assert(std::is_constructible_v<Exception, ErrorCode const&, StorageIRI const&>);
static_assert(!std::is_constructible_v<Exception, ErrorCode, std::u16string>);
static_assert(std::is_same_v<decltype(&Exception::getErrorCode), ErrorCode (Exception::*)() const>);
static_assert(std::is_same_v<decltype(&Exception::getStorageIRI), StorageIRI (Exception::*)() const>);
static_assert(std::is_same_v<decltype(&Exception::what), char const* (Exception::*)() const noexcept>);
static_assert(std::is_same_v<decltype(&Exception::ToUstringImpl), std::u16string (Exception::*)() const>);
static_assert(std::is_same_v<decltype(&Exception::clone), IException* (Exception::*)() const>);
static_assert(std::is_same_v<decltype(&Exception::rethrow), void (Exception::*)() const>);

StorageIRI const somewhere(u"s://h/a/b");

std::unique_ptr<IException> cloneOf(IException const& exception)
{
    return std::unique_ptr<IException>(exception.clone());
}

// Takes the entries away, as a handler does that assigns another Boost exception.
void loseEntries(boost::exception& exception)
{
    struct WithoutEntries : boost::exception
    {};
    exception = WithoutEntries();
}

TEST(Exception, CodeAndLocationAreThoseGiven)
{
    Exception const exception(ErrorCode::ResourceNotFound, somewhere);
    EXPECT_EQ(exception.getErrorCode(), ErrorCode::ResourceNotFound);
    EXPECT_EQ(exception.getStorageIRI(), somewhere);
}

TEST(Exception, CodeAndLocationAreErrorInformation)
{
    Exception const exception(ErrorCode::NoSpaceLeft, somewhere);
    ASSERT_NE(boost::get_error_info<ErrorCodeInfo>(exception), nullptr);
    EXPECT_EQ(*boost::get_error_info<ErrorCodeInfo>(exception), ErrorCode::NoSpaceLeft);
    ASSERT_NE(boost::get_error_info<StorageIRIInfo>(exception), nullptr);
    EXPECT_EQ(*boost::get_error_info<StorageIRIInfo>(exception), somewhere);
}

TEST(Exception, WhatIsTheClassNameAlone)
{
    for (ErrorCode const code : {ErrorCode::FileTooLarge, ErrorCode::IOError, static_cast<ErrorCode>(13)}) {
        Exception const exception(code, somewhere);
        EXPECT_STREQ(exception.what(), "foundation::storage::provider::Exception");
        EXPECT_STREQ(static_cast<std::exception const&>(exception).what(), exception.what());
        EXPECT_STREQ(static_cast<IException const&>(exception).what(), exception.what());
    }
}

TEST(Exception, TextNamesLocationAndCode)
{
    EXPECT_EQ(Exception(ErrorCode::ResourceNotFound, locationWithText(u"a/b")).ToUstringImpl(),
              u"foundation::storage::provider::Exception{StorageIRI=\"a/b\", "
              u"ErrorCode=\"ErrorCode::ResourceNotFound\"}");
    EXPECT_EQ(Exception(ErrorCode::IOError, somewhere).ToUstringImpl(),
              u"foundation::storage::provider::Exception{StorageIRI=\"s://h/a/b\", ErrorCode=\"ErrorCode::IOError\"}");
}

TEST(Exception, TextOfAnUnknownCodeSaysSo)
{
    EXPECT_EQ(Exception(static_cast<ErrorCode>(13), somewhere).ToUstringImpl(),
              u"foundation::storage::provider::Exception{StorageIRI=\"s://h/a/b\", ErrorCode=\"Unhandled ErrorCode\"}");
}

TEST(Exception, TextTakesTheLocationAsItIs)
{
    std::u16string const odd = u"a\"b\\\u00E9\U0001F4C1\n" + std::u16string(1, char16_t{0xD800}) + u"c";
    EXPECT_EQ(Exception(ErrorCode::Unknown, locationWithText(odd)).ToUstringImpl(),
              u"foundation::storage::provider::Exception{StorageIRI=\"" + odd +
                  u"\", ErrorCode=\"ErrorCode::Unknown\"}");
    EXPECT_EQ(Exception(ErrorCode::Unknown, locationWithText(u"")).ToUstringImpl(),
              u"foundation::storage::provider::Exception{StorageIRI=\"\", ErrorCode=\"ErrorCode::Unknown\"}");
}

TEST(Exception, FailureToMakeTheTextPassesAndLeavesTheExceptionAsItWas)
{
    struct Unspeakable : TextOnlyImpl
    {
        using TextOnlyImpl::TextOnlyImpl;
        std::u16string const& toString() const override { throw std::bad_alloc(); }
    };
    Exception const exception(ErrorCode::IOError, StorageIRI(std::make_shared<Unspeakable>(u"")));
    EXPECT_THROW(exception.ToUstringImpl(), std::bad_alloc);
    EXPECT_EQ(exception.getErrorCode(), ErrorCode::IOError);
    EXPECT_STREQ(exception.what(), "foundation::storage::provider::Exception");
}

TEST(Exception, PlaceOfTheThrowStartsEmpty)
{
    Exception const exception(ErrorCode::IOError, somewhere);
    EXPECT_EQ(boost::get_error_info<boost::throw_function>(exception), nullptr);
    EXPECT_EQ(boost::get_error_info<boost::throw_file>(exception), nullptr);
    EXPECT_EQ(boost::get_error_info<boost::throw_line>(exception), nullptr);
}

TEST(Exception, CloneIsOfTheSameTypeAndSaysTheSame)
{
    Exception const exception(ErrorCode::FolderNotEmpty, somewhere);
    auto const copy = cloneOf(exception);
    IException const& cloned = *copy;
    ASSERT_EQ(typeid(cloned), typeid(Exception));
    auto const& clone = dynamic_cast<Exception const&>(*copy);
    EXPECT_EQ(clone.getErrorCode(), ErrorCode::FolderNotEmpty);
    EXPECT_EQ(clone.getStorageIRI(), somewhere);
    EXPECT_EQ(clone.ToUstringImpl(), exception.ToUstringImpl());
}

TEST(Exception, CloneOutlivesTheOriginal)
{
    auto original = std::make_unique<Exception>(ErrorCode::IOError, somewhere);
    auto const copy = cloneOf(*original);
    original.reset();
    EXPECT_EQ(dynamic_cast<Exception const&>(*copy).getStorageIRI(), somewhere);
}

TEST(Exception, CloneKeepsThePlaceOfTheThrow)
{
    Exception exception(ErrorCode::IOError, somewhere);
    exception << boost::throw_function("f()") << boost::throw_file("f.cpp") << boost::throw_line(7);
    auto const copy = cloneOf(exception);
    EXPECT_STREQ(*boost::get_error_info<boost::throw_function>(*copy), "f()");
    EXPECT_STREQ(*boost::get_error_info<boost::throw_file>(*copy), "f.cpp");
    EXPECT_EQ(*boost::get_error_info<boost::throw_line>(*copy), 7);
}

TEST(Exception, EntriesAddedToACloneShowInTheOriginal)
{
    Exception const exception(ErrorCode::IOError, somewhere);
    auto const copy = cloneOf(exception);
    *copy << AttemptInfo(2);
    ASSERT_NE(boost::get_error_info<AttemptInfo>(exception), nullptr);
    EXPECT_EQ(*boost::get_error_info<AttemptInfo>(exception), 2);
}

TEST(Exception, EntriesAddedToARethrownExceptionShowInTheOriginal)
{
    Exception const exception(ErrorCode::IOError, somewhere);
    try {
        exception.rethrow();
    } catch (Exception const& thrown) {
        thrown << AttemptInfo(3) << ErrorCodeInfo(ErrorCode::ResourceInUse);
    }
    EXPECT_EQ(*boost::get_error_info<AttemptInfo>(exception), 3);
    EXPECT_EQ(exception.getErrorCode(), ErrorCode::ResourceInUse);
}

TEST(Exception, CaughtByValueSharesItsEntries)
{
    Exception const exception(ErrorCode::IOError, somewhere);
    Exception const copy = exception; // NOLINT(performance-unnecessary-copy-initialization)
    copy << AttemptInfo(4);
    EXPECT_EQ(*boost::get_error_info<AttemptInfo>(exception), 4);
}

TEST(Exception, RethrowThrowsTheDynamicTypeAndNotTheOriginal)
{
    std::unique_ptr<IException> const kept(new Exception(ErrorCode::IOError, somewhere));
    try {
        kept->rethrow();
        FAIL() << "nothing was thrown";
    } catch (Exception const& thrown) {
        EXPECT_EQ(typeid(thrown), typeid(Exception));
        EXPECT_NE(dynamic_cast<IException const*>(&thrown), kept.get());
        EXPECT_EQ(thrown.getErrorCode(), ErrorCode::IOError);
    }
}

TEST(Exception, LostEntryIsNotMadeUp)
{
    Exception exception(ErrorCode::IOError, somewhere);
    loseEntries(exception);
    EXPECT_THROW(exception.getErrorCode(), std::logic_error);
    EXPECT_THROW(exception.getStorageIRI(), std::logic_error);
    EXPECT_THROW(exception.ToUstringImpl(), std::logic_error);
    EXPECT_STREQ(exception.what(), "foundation::storage::provider::Exception");
}

TEST(Exception, IsCaughtByItsBasesAlone)
{
    Exception const exception(ErrorCode::IOError, somewhere);
    EXPECT_THROW(exception.rethrow(), Exception);
    EXPECT_THROW(exception.rethrow(), std::exception);
    EXPECT_THROW(exception.rethrow(), boost::exception);
    EXPECT_THROW(exception.rethrow(), core::except::IInternalException);
    EXPECT_THROW(exception.rethrow(), IException);
    EXPECT_EQ(dynamic_cast<std::ios_base::failure const*>(static_cast<IException const*>(&exception)), nullptr);
}

// Which handler, tried in this order, an exception reaches.
std::string handlerFor(IException const& exception)
{
    try {
        exception.rethrow();
    } catch (Exception const&) {
        return "Exception";
    } catch (ChangeEventsNotSupportedException const&) {
        return "ChangeEventsNotSupportedException";
    } catch (ChangeEventsSubscriptionException const&) {
        return "ChangeEventsSubscriptionException";
    } catch (std::ios_base::failure const&) {
        return "failure";
    } catch (std::exception const&) {
        return "std::exception";
    }
    return "nothing was thrown";
}

TEST(Exception, SiblingsDoNotCatchEachOther)
{
    EXPECT_EQ(handlerFor(Exception(ErrorCode::IOError, somewhere)), "Exception");
    EXPECT_EQ(handlerFor(ChangeEventsNotSupportedException(somewhere)), "ChangeEventsNotSupportedException");
    EXPECT_EQ(handlerFor(ChangeEventsSubscriptionException(somewhere)), "ChangeEventsSubscriptionException");
    EXPECT_EQ(handlerFor(ByteStreamWriteFailure()), "failure");
}

TEST(Exception, IsCaughtByTypeWhenTheLibraryThrowsIt)
{
    MinimalProvider const provider;
    try {
        provider.removeFolderRecursively(somewhere);
        FAIL() << "nothing was thrown";
    } catch (Exception const& thrown) {
        EXPECT_EQ(typeid(thrown), typeid(Exception));
        EXPECT_EQ(thrown.getErrorCode(), ErrorCode::UnsupportedOperation);
    }
}

TEST(Exception, DiagnosticInformationNamesTypeCodeAndLocation)
{
    std::string const information = boost::diagnostic_information(
        Exception(ErrorCode::ResourceInUse, locationWithText(u"s://h/\"caf\u00E9\"")) << AttemptInfo(42));
    EXPECT_NE(information.find("foundation::storage::provider::Exception"), std::string::npos) << information;
    EXPECT_NE(information.find("ErrorCode::ResourceInUse"), std::string::npos) << information;
    EXPECT_NE(information.find("s://h/\"caf\xC3\xA9\""), std::string::npos) << information;
    EXPECT_NE(information.find("42"), std::string::npos) << information;
}

TEST(Exception, VirtualFunctionsStandInTheOrderOfTheInterface)
{
    EXPECT_EQ(slotOf(&Exception::clone), 0u);
    EXPECT_EQ(slotOf(&Exception::rethrow), 1u);
    EXPECT_EQ(slotOf(&Exception::what), 4u);
    EXPECT_EQ(slotOf(&Exception::ToUstringImpl), 7u);
    EXPECT_FALSE(isVirtual(&Exception::getErrorCode));
    EXPECT_FALSE(isVirtual(&Exception::getStorageIRI));
}

TEST(Exception, InterfaceIsThePrimaryBase)
{
    Exception const exception(ErrorCode::IOError, somewhere);
    IException const* interface = &exception;
    EXPECT_EQ(static_cast<void const*>(interface), static_cast<void const*>(&exception));
}

} // namespace
} // namespace foundation::storage::provider
