#include <storage/registry/OpenException.hpp>

#include <tests/support/printed.hpp>

#include <gtest/gtest.h>

#include <memory>

namespace foundation::storage::registry {
namespace {

using namespace provider;
using namespace tests::support;
using core::except::IException;
using Reason = OpenException::Reason;

StorageIRI const place(u"zip:/a");

struct Row
{
    Reason reason;
    char const* name;
    char16_t const* text;
};

constexpr Row rows[] = {
    {Reason::UnknownScheme, "Reason::UnknownScheme", u"Cannot open \"zip:/a\": no store serves the scheme \"zip\"."},
    {Reason::ContainerNeedsContainer, "Reason::ContainerNeedsContainer",
     u"Cannot open \"zip:/a\": the scheme \"zip\" names places inside a container, whose own location must follow, as "
     u"in \"zip:file:///container!/place\"."},
    {Reason::PlainSchemeOfContainer, "Reason::PlainSchemeOfContainer",
     u"Cannot open \"zip:/a\": the scheme \"zip\" names no places inside a container; '/' must follow \"zip:\"."},
    {Reason::CredentialsInLocation, "Reason::CredentialsInLocation",
     u"Cannot open \"zip:/a\": a location must not carry a password, which belongs to the configuration."},
};

TEST(OpenException, IsAnInvalidLocationWithAReason)
{
    for (Row const& row : rows) {
        OpenException const error(row.reason, place);
        EXPECT_EQ(error.getErrorCode(), ErrorCode::InvalidLocation);
        EXPECT_EQ(error.getStorageIRI(), place);
        EXPECT_EQ(error.getReason(), row.reason);
    }
}

TEST(OpenException, TextSaysWhatIsWrong)
{
    for (Row const& row : rows)
        EXPECT_EQ(OpenException(row.reason, place).ToUstringImpl(), row.text) << row.name;
}

TEST(OpenException, WhatIsTheClassNameAlone)
{
    EXPECT_STREQ(OpenException(Reason::UnknownScheme, place).what(), "foundation::storage::registry::OpenException");
}

TEST(OpenException, ReasonsAreCaughtAsFailuresOfProvidersAre)
{
    EXPECT_THROW(throw OpenException(Reason::UnknownScheme, place), Exception);
}

TEST(OpenException, CloneAndRethrowKeepTypeAndReason)
{
    std::unique_ptr<IException> const copy(OpenException(Reason::PlainSchemeOfContainer, place).clone());
    try {
        copy->rethrow();
        FAIL() << "nothing was thrown";
    } catch (OpenException const& error) {
        EXPECT_EQ(error.getReason(), Reason::PlainSchemeOfContainer);
        EXPECT_EQ(error.getStorageIRI(), place);
    }
}

TEST(OpenException, ReasonsArePrintedByName)
{
    for (Row const& row : rows)
        EXPECT_EQ(printed(row.reason), row.name);
    EXPECT_EQ(printed(static_cast<Reason>(4)), "Unhandled Reason");
    EXPECT_TRUE(answersItsStream(Reason::UnknownScheme));
}

} // namespace
} // namespace foundation::storage::registry
