#include <foundation/core/except/AnonymousInternalException.hpp>

#include <boost/exception/diagnostic_information.hpp>
#include <boost/exception/info.hpp>

#include <gtest/gtest.h>

#include <memory>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <typeinfo>

#include <tests/support/ErrorInfo.hpp>
#include <tests/support/slotOf.hpp>

namespace foundation::core::except::detail {
namespace {

using tests::valueOf;

using AttemptInfo = boost::error_info<struct TagAttempt, int>;
using LogicError = AnonymousInternalException<std::logic_error>;
using RuntimeError = AnonymousInternalException<std::runtime_error>;

static_assert(std::is_base_of_v<Exception<IInternalException, std::logic_error, void>, LogicError>);
static_assert(std::is_base_of_v<Exception<IInternalException, std::runtime_error, void>, RuntimeError>);
static_assert(!std::is_convertible_v<std::string, LogicError>);
static_assert(std::is_same_v<decltype(&LogicError::clone), IException* (LogicError::*)() const>);
static_assert(std::is_same_v<decltype(&LogicError::rethrow), void (LogicError::*)() const>);

// Thrown by code of the library, where the templates are instantiated.
void throwFromLibrary(IException const& exception)
{
    exception.rethrow();
}

TEST(AnonymousInternalException, WhatIsTheMessage)
{
    EXPECT_STREQ(LogicError("IRI does not have a parent IRI.").what(), "IRI does not have a parent IRI.");
    EXPECT_STREQ(RuntimeError("caf\xC3\xA9").what(), "caf\xC3\xA9");
}

TEST(AnonymousInternalException, TextIsTheMessageInUtf16)
{
    EXPECT_EQ(RuntimeError("caf\xC3\xA9 \xF0\x9F\x93\x81").ToUstringImpl(), u"caf\u00E9 \U0001F4C1");
}

TEST(AnonymousInternalException, MalformedMessageIsReplacedAndDoesNotThrow)
{
    RuntimeError const exception("a\xFFz");
    EXPECT_EQ(exception.ToUstringImpl(), u"a\uFFFDz");
    EXPECT_STREQ(exception.what(), "a\xEF\xBF\xBDz");
}

TEST(AnonymousInternalException, TextGoesThroughTheConversionSlot)
{
    struct Shouting : LogicError
    {
        using LogicError::LogicError;
        std::u16string convert_str(std::string const& text) const override
        {
            return LogicError::convert_str(text) + u"!";
        }
        using LogicError::convert_str;
    };
    EXPECT_EQ(Shouting("x").ToUstringImpl(), u"x!");
    EXPECT_STREQ(Shouting("x").what(), "x!");
}

TEST(AnonymousInternalException, CloneHasTheTypeAndTheMessage)
{
    std::unique_ptr<IException> const copy(std::make_unique<LogicError>("message")->clone());
    ASSERT_NE(dynamic_cast<LogicError*>(copy.get()), nullptr);
    EXPECT_STREQ(copy->what(), "message");
}

TEST(AnonymousInternalException, CopiesShareTheErrorInformation)
{
    RuntimeError exception("message");
    exception << AttemptInfo(1);
    std::unique_ptr<IException> const copy(exception.clone());
    *copy << AttemptInfo(2);
    EXPECT_EQ(valueOf<AttemptInfo>(exception), 2);
    try {
        copy->rethrow();
    } catch (boost::exception const& thrown) {
        thrown << AttemptInfo(3);
    }
    EXPECT_EQ(valueOf<AttemptInfo>(exception), 3);
}

TEST(AnonymousInternalException, RethrowThrowsTheDynamicType)
{
    try {
        throwFromLibrary(RuntimeError("message"));
        FAIL() << "nothing was thrown";
    } catch (std::exception const& thrown) {
        EXPECT_EQ(typeid(thrown), typeid(RuntimeError));
        EXPECT_STREQ(thrown.what(), "message");
    }
}

TEST(AnonymousInternalException, IsCaughtByEachOfItsBases)
{
    LogicError const exception("message");
    EXPECT_THROW(throwFromLibrary(exception), LogicError);
    EXPECT_THROW(throwFromLibrary(exception), std::logic_error);
    EXPECT_THROW(throwFromLibrary(exception), std::exception);
    EXPECT_THROW(throwFromLibrary(exception), boost::exception);
    EXPECT_THROW(throwFromLibrary(exception), IInternalException);
    EXPECT_THROW(throwFromLibrary(exception), IException);
    EXPECT_THROW(throwFromLibrary(RuntimeError("message")), std::runtime_error);
}

TEST(AnonymousInternalException, VirtualFunctionsStandInTheOrderOfTheInterface)
{
    using tests::support::slotOf;
    EXPECT_EQ(slotOf(&RuntimeError::clone), 0u);
    EXPECT_EQ(slotOf(&RuntimeError::rethrow), 1u);
    EXPECT_EQ(slotOf(&RuntimeError::what), 4u);
    EXPECT_EQ(slotOf(&RuntimeError::ToUstringImpl), 7u);
    RuntimeError const exception("message");
    IException const* interface = &exception;
    EXPECT_EQ(static_cast<void const*>(interface), static_cast<void const*>(&exception));
}

TEST(AnonymousInternalException, DiagnosticInformationNamesTypeAndMessage)
{
    std::string const information = boost::diagnostic_information(RuntimeError("what went wrong") << AttemptInfo(42));
    EXPECT_NE(information.find("AnonymousInternalException<std::runtime_error>"), std::string::npos) << information;
    EXPECT_NE(information.find("what went wrong"), std::string::npos) << information;
    EXPECT_NE(information.find("42"), std::string::npos) << information;
}

} // namespace
} // namespace foundation::core::except::detail
