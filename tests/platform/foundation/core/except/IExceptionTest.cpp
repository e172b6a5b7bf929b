#include <foundation/core/except/IException.hpp>

#include <gtest/gtest.h>

#include <cstddef>
#include <ios>
#include <memory>
#include <stdexcept>
#include <string>
#include <system_error>
#include <vector>

#include <foundation/core/except/AnonymousInternalException.hpp>
#include <tests/support/inThreads.hpp>
#include <tests/support/slotOf.hpp>

namespace foundation::core::except {
namespace {

// An exception that has no standard base.
struct Bare : IException
{
    IException* clone() const override { return new Bare(*this); }
    void rethrow() const override { throw Bare(*this); }
};

// A standard exception that leaves `what` to each of its bases.
struct TwoVoices : IInternalException, std::runtime_error
{
    using IInternalException::what;
    using std::runtime_error::runtime_error;
    IException* clone() const override { return new TwoVoices(*this); }
    void rethrow() const override { throw TwoVoices(*this); }
};

// A standard exception whose `what` forwards to the interface while `ToUstringImpl` stays the interface's own.
template <class StdBase>
struct Forwarding : IInternalException, StdBase
{
    using StdBase::StdBase;
    char const* what() const noexcept override { return IException::what(); }
    IException* clone() const override { return new Forwarding(*this); }
    void rethrow() const override { throw Forwarding(*this); }
};

// A standard exception that words its own message.
struct OwnWords : IInternalException, std::exception
{
    char const* what() const noexcept override { return "own words"; }
    IException* clone() const override { return new OwnWords(*this); }
    void rethrow() const override { throw OwnWords(*this); }
};

// A standard exception that asks another one before it forwards to the interface.
struct Quoting : IInternalException, std::runtime_error
{
    using std::runtime_error::runtime_error;
    char const* what() const noexcept override
    {
        return OwnWords().ToUstringImpl() == u"own words" ? IException::what() : "the other one lost its words";
    }
    IException* clone() const override { return new Quoting(*this); }
    void rethrow() const override { throw Quoting(*this); }
};

struct Garbled : Bare
{
    std::u16string ToUstringImpl() const override { return {u'a', char16_t{0xD800}, u'b'}; }
};

struct Speechless : Bare
{
    std::u16string ToUstringImpl() const override { throw std::bad_alloc(); }
};

using tests::support::slotOf;
using FromUtf16 = std::u16string (IException::*)(std::u16string const&) const;
using FromUtf8 = std::u16string (IException::*)(std::string const&) const;

TEST(IException, VirtualFunctionsStandInTheOrderOfTheInterface)
{
    EXPECT_EQ(slotOf(&IException::clone), 0u);
    EXPECT_EQ(slotOf(&IException::rethrow), 1u);
    // The complete and the deleting destructor take slots 2 and 3.
    EXPECT_EQ(slotOf(&IException::what), 4u);
    EXPECT_EQ(slotOf(static_cast<FromUtf16>(&IException::convert_str)), 5u);
    EXPECT_EQ(slotOf(static_cast<FromUtf8>(&IException::convert_str)), 6u);
    EXPECT_EQ(slotOf(&IException::ToUstringImpl), 7u);
}

TEST(IException, InterfaceIsThePrimaryBaseOfAConcreteException)
{
    detail::AnonymousInternalException<std::logic_error> const exception("message");
    IException const* interface = &exception;
    EXPECT_EQ(static_cast<void const*>(interface), static_cast<void const*>(&exception));
}

TEST(IException, ConvertsUtf16TextToItself)
{
    std::u16string const text = {u'a', char16_t{0xD800}, u'b'};
    EXPECT_EQ(Bare().convert_str(text), text);
}

TEST(IException, ConvertsUtf8TextAndReplacesMalformedBytes)
{
    EXPECT_EQ(Bare().convert_str(std::string("a\xC3\xA9\xFF")), u"a\u00E9\uFFFD");
}

TEST(IException, TextWithoutAStandardBaseIsTheNameOfTheType)
{
    EXPECT_NE(Bare().ToUstringImpl().find(u"Bare"), std::u16string::npos);
}

TEST(IException, TextIsWhatTheStandardBaseSays)
{
    EXPECT_EQ(OwnWords().ToUstringImpl(), u"own words");
    EXPECT_EQ(TwoVoices("two").ToUstringImpl(), u"two");
}

TEST(IException, WhatIsTheTextInUtf8)
{
    IException const& exception = TwoVoices("caf\xC3\xA9");
    EXPECT_STREQ(exception.what(), "caf\xC3\xA9");
}

TEST(IException, ForwardingWhatToTheInterfaceEndsAtTheStandardClass)
{
    Forwarding<std::runtime_error> const runtimeError("runtime");
    EXPECT_EQ(runtimeError.ToUstringImpl(), u"runtime");
    EXPECT_STREQ(runtimeError.what(), "runtime");

    Forwarding<std::logic_error> const logicError("logic");
    EXPECT_STREQ(logicError.what(), "logic");
    EXPECT_EQ(logicError.ToUstringImpl(), u"logic");

    Forwarding<std::exception> const plain;
    EXPECT_STREQ(plain.what(), std::exception().what());
}

TEST(IException, ForwardingWhatOfAStreamFailureKeepsTheCategoryText)
{
    std::ios_base::failure const reference("broken", std::make_error_code(std::io_errc::stream));
    Forwarding<std::ios_base::failure> const failure("broken", std::make_error_code(std::io_errc::stream));
    EXPECT_STREQ(failure.what(), reference.what());
}

TEST(IException, AskingOneExceptionOnBehalfOfAnotherDisturbsNeither)
{
    Quoting const exception("runtime");
    EXPECT_EQ(exception.ToUstringImpl(), u"runtime");
    EXPECT_STREQ(exception.what(), "runtime");
}

TEST(IException, WhatReplacesLoneSurrogatesOfTheText)
{
    EXPECT_STREQ(Garbled().what(), "a\xEF\xBF\xBD"
                                   "b");
}

TEST(IException, WhatHasAFixedTextWhenTheTextCannotBeMade)
{
    EXPECT_STREQ(Speechless().what(), "foundation::core::except::IException (its text could not be made)");
}

TEST(IException, WhatLivesWithTheObjectAndNotWithItsCopies)
{
    auto original = std::make_unique<TwoVoices>("text");
    IException const& interface = *original;
    char const* const first = interface.what();
    TwoVoices const copy(*original);
    EXPECT_EQ(interface.what(), first);
    EXPECT_NE(static_cast<IException const&>(copy).what(), first);
    original.reset();
    EXPECT_STREQ(static_cast<IException const&>(copy).what(), "text");
}

TEST(IException, AssignmentDropsTheTextOfThePast)
{
    TwoVoices exception("old");
    IException const& interface = exception;
    EXPECT_STREQ(interface.what(), "old");
    exception = TwoVoices("new");
    EXPECT_STREQ(interface.what(), "new");
}

TEST(IExceptionConcurrency, AllThreadsGetOneText)
{
    TwoVoices const exception("shared");
    IException const& interface = exception;
    std::vector<char const*> seen(32);
    tests::support::inThreads(32, [&](int thread) { seen[static_cast<std::size_t>(thread)] = interface.what(); });
    EXPECT_STREQ(seen.front(), "shared");
    EXPECT_EQ(seen, std::vector<char const*>(seen.size(), seen.front()));
}

} // namespace
} // namespace foundation::core::except
