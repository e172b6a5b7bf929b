#include <foundation/core/except/Exception.hpp>

#include <boost/exception/info.hpp>

#include <gtest/gtest.h>

#include <ios>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <type_traits>

#include <tests/support/ErrorInfo.hpp>

namespace foundation::core::except {
namespace {

using tests::valueOf;

using AttemptInfo = boost::error_info<struct TagAttempt, int>;

struct Nameless : Exception<IInternalException, std::exception, void>
{
    IException* clone() const override { return new Nameless(*this); }
    void rethrow() const override { throw Nameless(*this); }
};

struct Worded : Exception<IException, std::ios_base::failure, struct TagWorded>
{
    using Exception::Exception;
    IException* clone() const override { return new Worded(*this); }
    void rethrow() const override { throw Worded(*this); }
};

// As a location exception does it: a fixed `what`, a full text in `ToUstringImpl`.
struct Detailed : Nameless
{
    char const* what() const noexcept override { return "Detailed"; }
    std::u16string ToUstringImpl() const override { return u"Detailed{all of it}"; }
};

TEST(Exception, LeavesCloneAndRethrowToTheConcreteClass)
{
    EXPECT_TRUE((std::is_abstract_v<Exception<IInternalException, std::logic_error, void>>));
    EXPECT_FALSE(std::is_abstract_v<Worded>);
}

TEST(Exception, TextOfAStandardBaseWithoutMessageIsItsOwn)
{
    Nameless const exception;
    EXPECT_STREQ(exception.what(), std::exception().what());
    EXPECT_EQ(exception.ToUstringImpl(), u"std::exception");
}

TEST(Exception, BothBasesSayTheMessage)
{
    Worded const exception(std::string("caf\xC3\xA9"));
    std::string const expected = std::ios_base::failure("caf\xC3\xA9").what();
    EXPECT_EQ(static_cast<std::exception const&>(exception).what(), expected);
    EXPECT_EQ(static_cast<IException const&>(exception).what(), expected);
}

TEST(Exception, OverridesOfTheTextsStandApart)
{
    Detailed const exception;
    EXPECT_STREQ(static_cast<std::exception const&>(exception).what(), "Detailed");
    EXPECT_EQ(static_cast<IException const&>(exception).ToUstringImpl(), u"Detailed{all of it}");
}

TEST(Exception, EntriesAddedToACloneShowInTheOriginal)
{
    Nameless exception;
    exception << AttemptInfo(1);
    std::unique_ptr<IException> const copy(exception.clone());
    *copy << AttemptInfo(2);
    EXPECT_EQ(valueOf<AttemptInfo>(exception), 2);
}

TEST(Exception, CloneKeepsThePlaceOfTheThrow)
{
    Nameless exception;
    exception << boost::throw_function("f()") << boost::throw_file("f.cpp") << boost::throw_line(7);
    std::unique_ptr<IException> const copy(exception.clone());
    EXPECT_EQ(valueOf<boost::throw_function>(*copy), std::string("f()"));
    EXPECT_EQ(valueOf<boost::throw_file>(*copy), std::string("f.cpp"));
    EXPECT_EQ(valueOf<boost::throw_line>(*copy), 7);
}

TEST(Exception, PlaceOfTheThrowStartsEmpty)
{
    Nameless const exception;
    EXPECT_EQ(valueOf<boost::throw_function>(exception), std::nullopt);
    EXPECT_EQ(valueOf<boost::throw_file>(exception), std::nullopt);
    EXPECT_EQ(valueOf<boost::throw_line>(exception), std::nullopt);
}

} // namespace
} // namespace foundation::core::except
