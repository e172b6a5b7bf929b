#include <storage/registry/FactoryException.hpp>

#include <gtest/gtest.h>

#include <memory>

namespace foundation::storage::registry {
namespace {

using namespace provider;

FactoryException const error(ErrorCode::PermissionDenied, StorageIRI(u"s://h/a"));

TEST(FactoryException, TextNamesLocationAndCode)
{
    EXPECT_EQ(error.ToUstringImpl(), u"The store of \"s://h/a\" failed with ErrorCode::PermissionDenied. What it said "
                                     u"is withheld, because it could repeat settings.");
}

TEST(FactoryException, WhatIsTheClassNameAlone)
{
    EXPECT_STREQ(error.what(), "foundation::storage::registry::FactoryException");
}

TEST(FactoryException, CloneAndRethrowKeepTypeLocationAndCode)
{
    std::unique_ptr<core::except::IException> const copy(error.clone());
    try {
        copy->rethrow();
        FAIL() << "nothing was thrown";
    } catch (FactoryException const& thrown) {
        EXPECT_EQ(thrown.getErrorCode(), ErrorCode::PermissionDenied);
        EXPECT_EQ(thrown.getStorageIRI(), StorageIRI(u"s://h/a"));
    }
}

} // namespace
} // namespace foundation::storage::registry
