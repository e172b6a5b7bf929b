// Creating a folder with its ancestors, as a provider inherits it: the exact calls, and what comes of them.

#include <storage/provider/IProvider.hpp>

#include <storage/provider/Exception.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/RecordingProvider.hpp>
#include <tests/support/failureOf.hpp>

#include <gtest/gtest.h>

#include <set>
#include <stdexcept>
#include <string>
#include <vector>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;
using fl::filesystem::upath;

StorageIRI at(std::u16string const& text)
{
    return StorageIRI(text);
}

class CreateFolderRecursive : public testing::Test
{
protected:
    void folderExists(std::string const& text)
    {
        provider.when("doFolderExists(" + text + ")", [] { return true; });
    }

    // The calls that creating a folder leads to, after the first.
    CallLog callsFor(std::u16string const& text)
    {
        provider.createFolderRecursive(at(text));
        return CallLog(log.begin() + 1, log.end());
    }

    CallLog log;
    RecordingProvider provider{log};
};

TEST_F(CreateFolderRecursive, WithAParentCreatesTheFolderAlone)
{
    folderExists("s://h/a");
    EXPECT_EQ(callsFor(u"s://h/a/b"), (CallLog{"doFolderExists(s://h/a)", "doCreateFolder(s://h/a/b)"}));
}

TEST_F(CreateFolderRecursive, CreatesMissingAncestorsFromTheOutermost)
{
    folderExists("s://h/a");
    EXPECT_EQ(callsFor(u"s://h/a/b/c/d"),
              (CallLog{"doFolderExists(s://h/a/b/c)", "doFolderExists(s://h/a/b/c)", "doFolderExists(s://h/a/b)",
                       "doFolderExists(s://h/a)", "doCreateFolder(s://h/a/b)", "doCreateFolder(s://h/a/b/c)",
                       "doCreateFolder(s://h/a/b/c/d)"}));
}

TEST_F(CreateFolderRecursive, WalksUpToTheRoot)
{
    folderExists("s://h/");
    EXPECT_EQ(callsFor(u"s://h/a/b"),
              (CallLog{"doFolderExists(s://h/a)", "doFolderExists(s://h/a)", "doFolderExists(s://h/)",
                       "doCreateFolder(s://h/a)", "doCreateFolder(s://h/a/b)"}));
}

TEST_F(CreateFolderRecursive, ExistingFolderIsNotAskedForAndTheProviderDecides)
{
    folderExists("s://h/a");
    folderExists("s://h/a/b");
    provider.fail("doCreateFolder(s://h/a/b)", Exception(ErrorCode::ResourceAlreadyExists, at(u"s://h/a/b")));
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/a/b")); }),
              failure(ErrorCode::ResourceAlreadyExists, at(u"s://h/a/b")));
    EXPECT_EQ(log,
              (CallLog{"doCreateFolderRecursive(s://h/a/b)", "doFolderExists(s://h/a)", "doCreateFolder(s://h/a/b)"}));
}

TEST_F(CreateFolderRecursive, OfAnExistingRootIsRefused)
{
    folderExists("s://h/");
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/")); }),
              failure(ErrorCode::ResourceAlreadyExists, at(u"s://h/")));
    EXPECT_EQ(log, (CallLog{"doCreateFolderRecursive(s://h/)", "doFolderExists(s://h/)"}));
}

TEST_F(CreateFolderRecursive, OfAMissingRootIsRefused)
{
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/")); }),
              failure(ErrorCode::ResourceNotFound, at(u"s://h/")));
    EXPECT_EQ(log, (CallLog{"doCreateFolderRecursive(s://h/)", "doFolderExists(s://h/)"}));
}

TEST_F(CreateFolderRecursive, WithoutAnyAncestorIsInvalidAndCreatesNothing)
{
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/a/b")); }),
              failure(ErrorCode::InvalidLocation, at(u"s://h/a/b")));
    EXPECT_EQ(log, (CallLog{"doCreateFolderRecursive(s://h/a/b)", "doFolderExists(s://h/a)", "doFolderExists(s://h/a)",
                            "doFolderExists(s://h/)"}));
}

TEST_F(CreateFolderRecursive, OfALocationThatHasNoParentAfterAllIsInvalid)
{
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h")); }),
              failure(ErrorCode::InvalidLocation, at(u"s://h")));
    EXPECT_EQ(log, CallLog{"doCreateFolderRecursive(s://h)"});
}

TEST_F(CreateFolderRecursive, LogicErrorDuringTheWalkIsInvalid)
{
    provider.fail("doFolderExists(s://h/a)", std::out_of_range("confused"));
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/a/b/c")); }),
              failure(ErrorCode::InvalidLocation, at(u"s://h/a/b/c")));
}

TEST_F(CreateFolderRecursive, LogicErrorBeforeTheWalkPassesUnchanged)
{
    provider.fail("doFolderExists(s://h/a)", std::out_of_range("confused"));
    EXPECT_THROW(provider.createFolderRecursive(at(u"s://h/a/b")), std::out_of_range);
}

TEST_F(CreateFolderRecursive, OtherFailuresOfTheWalkPassUnchanged)
{
    provider.fail("doFolderExists(s://h/a)", Exception(ErrorCode::PermissionDenied, at(u"s://h/a")));
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/a/b/c")); }),
              failure(ErrorCode::PermissionDenied, at(u"s://h/a")));
    provider.fail("doFolderExists(s://h/a)", std::runtime_error("offline"));
    EXPECT_THROW(provider.createFolderRecursive(at(u"s://h/a/b/c")), std::runtime_error);
    EXPECT_THROW(provider.createFolderRecursive(at(u"s://h/a/b")), std::runtime_error);
}

TEST_F(CreateFolderRecursive, FailureForAnAncestorKeepsItsCodeAndNamesTheFolderAskedFor)
{
    folderExists("s://h/a");
    provider.fail("doCreateFolder(s://h/a/b/c)", Exception(ErrorCode::NoSpaceLeft, at(u"s://h/a/b/c")));
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/a/b/c/d")); }),
              failure(ErrorCode::NoSpaceLeft, at(u"s://h/a/b/c/d")));
    EXPECT_EQ(log.back(), "doCreateFolder(s://h/a/b/c)") << "nothing is undone, and nothing more is created";
}

TEST_F(CreateFolderRecursive, FailureInTheOneLevelCasePassesUnchanged)
{
    folderExists("s://h/a");
    provider.fail("doCreateFolder", Exception(ErrorCode::NoSpaceLeft, at(u"s://elsewhere/")));
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/a/b")); }),
              failure(ErrorCode::NoSpaceLeft, at(u"s://elsewhere/")));
}

TEST_F(CreateFolderRecursive, OtherExceptionsOfCreationPassUnchanged)
{
    folderExists("s://h/a");
    provider.fail("doCreateFolder(s://h/a/b)", std::logic_error("confused"));
    EXPECT_THROW(provider.createFolderRecursive(at(u"s://h/a/b/c")), std::logic_error);
    provider.fail("doCreateFolder(s://h/a/b)", 42);
    EXPECT_THROW(provider.createFolderRecursive(at(u"s://h/a/b/c")), int);
}

TEST_F(CreateFolderRecursive, FoldersCreatedBeforeAFailureStay)
{
    struct Short : MinimalProvider
    {
        void doCreateFolder(StorageIRI const& iri) const override
        {
            if (folders.size() == 3)
                throw Exception(ErrorCode::NoSpaceLeft, iri);
            MinimalProvider::doCreateFolder(iri);
        }
    };
    Short store;
    store.folders = {at(u"s://h/")};
    EXPECT_EQ(failureOf([&] { store.createFolderRecursive(at(u"s://h/a/b/c")); }),
              failure(ErrorCode::NoSpaceLeft, at(u"s://h/a/b/c")));
    EXPECT_EQ(store.folders, (std::set{at(u"s://h/"), at(u"s://h/a"), at(u"s://h/a/b")}));
}

// Has a root at most, and keeps the paths that it was asked for.
struct Bare : MinimalProvider
{
    bool doFolderExists(StorageIRI const& iri) const override
    {
        asked.push_back(iri.getPath());
        return rootExists && !iri.hasParent();
    }
    void doCreateFolder(StorageIRI const& iri) const override { created.push_back(iri.getPath()); }

    bool rootExists = false;
    mutable std::vector<std::u16string> asked;
    mutable std::vector<std::u16string> created;
};

using Paths = std::vector<std::u16string>;

class CreateFolderRecursiveEverywhere : public testing::TestWithParam<StorageIRI>
{
protected:
    StorageIRI const root = GetParam();
    StorageIRI const inner{StorageIRI(root, u"a"), u"b"};
    Bare store;
};

TEST_P(CreateFolderRecursiveEverywhere, NeverCreatesTheRoot)
{
    EXPECT_EQ(failureOf([&] { store.createFolderRecursive(root); }), failure(ErrorCode::ResourceNotFound, root));
    store.rootExists = true;
    EXPECT_EQ(failureOf([&] { store.createFolderRecursive(root); }), failure(ErrorCode::ResourceAlreadyExists, root));
    EXPECT_EQ(store.asked, (Paths{u"/", u"/"}));
    EXPECT_EQ(store.created, Paths());
}

TEST_P(CreateFolderRecursiveEverywhere, CreatesWhatIsMissingBelowTheRoot)
{
    store.rootExists = true;
    store.createFolderRecursive(inner);
    EXPECT_EQ(store.created, (Paths{u"/a", u"/a/b"}));
}

TEST_P(CreateFolderRecursiveEverywhere, DoesNotLeaveTheRoot)
{
    EXPECT_EQ(failureOf([&] { store.createFolderRecursive(inner); }), failure(ErrorCode::InvalidLocation, inner));
    EXPECT_EQ(store.asked, (Paths{u"/a", u"/a", u"/"}));
    EXPECT_EQ(store.created, Paths());
}

INSTANTIATE_TEST_SUITE_P(Roots, CreateFolderRecursiveEverywhere,
                         testing::Values(at(u"s://h/"), at(u"zip:file:///x/y.zip!/"),
                                         StorageIRI(u"file", upath(u"/"))));

} // namespace
} // namespace foundation::storage::provider
