#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <array>
#include <boost/property_tree/ptree.hpp>
#include <filesystem>
#include <string>
#include <sys/stat.h>
#include <sys/xattr.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

/// Copies of a file that has a time and an attribute of its own.
class LocalProviderPreservation : public testing::Test
{
protected:
    void SetUp() override
    {
        folder.write("source", "content");
        fs::path const path = folder / "source";
        if (::setxattr(path.c_str(), "user.colour", "red", 3, 0) != 0)
            GTEST_SKIP() << "the folder for temporary files has no extended attributes";
        std::array<timespec, 2> const times{timespec{.tv_sec = 0, .tv_nsec = UTIME_OMIT},
                                            timespec{.tv_sec = 1'100'000'000, .tv_nsec = 987'654'321}};
        ASSERT_EQ(::utimensat(AT_FDCWD, path.c_str(), times.data(), 0), 0);
    }

    void preserve(std::string const& what)
    {
        boost::property_tree::ptree settings;
        settings.put("preserve", what);
        provider.configure(settings);
    }

    void copyInPlace() const
    {
        provider.copyFile(folder.iri(u"source"), folder.iri(u"in place"), ReplacementPolicy::Preserve);
    }

    void copyAtomic() const
    {
        provider.copyFileAtomic(folder.iri(u"source"), folder.iri(u"atomic"), ReplacementPolicy::Preserve, {});
    }

    void copyBoth() const
    {
        copyInPlace();
        copyAtomic();
    }

    bool hasTime(std::string const& name) const
    {
        struct stat status = {};
        EXPECT_EQ(::stat((folder / name).c_str(), &status), 0);
        return status.st_mtim.tv_sec == 1'100'000'000 && status.st_mtim.tv_nsec == 987'654'321;
    }

    bool hasAttribute(std::string const& name) const
    {
        std::array<char, 8> value;
        return ::getxattr((folder / name).c_str(), "user.colour", value.data(), value.size()) == 3;
    }

    TemporaryFolder const folder;
    LocalProvider provider;
};

TEST_F(LocalProviderPreservation, IsNotDoneUnlessAskedFor)
{
    copyBoth();
    for (char const* const name : {"in place", "atomic"}) {
        EXPECT_FALSE(hasTime(name)) << name;
        EXPECT_FALSE(hasAttribute(name)) << name;
    }
}

TEST_F(LocalProviderPreservation, KeepsTheTimeToTheNanosecond)
{
    preserve("times");
    copyBoth();
    for (char const* const name : {"in place", "atomic"}) {
        EXPECT_TRUE(hasTime(name)) << name;
        EXPECT_FALSE(hasAttribute(name)) << name;
    }
}

TEST_F(LocalProviderPreservation, KeepsTheAttributesOfTheUser)
{
    preserve("xattrs");
    copyBoth();
    for (char const* const name : {"in place", "atomic"}) {
        EXPECT_FALSE(hasTime(name)) << name;
        EXPECT_TRUE(hasAttribute(name)) << name;
    }
}

TEST_F(LocalProviderPreservation, KeepsBoth)
{
    preserve("xattrs,times");
    copyBoth();
    for (char const* const name : {"in place", "atomic"}) {
        EXPECT_TRUE(hasTime(name)) << name;
        EXPECT_TRUE(hasAttribute(name)) << name;
    }
}

TEST_F(LocalProviderPreservation, NamesATargetThatHasNoAttributesAndLeavesNothingThere)
{
    preserve("xattrs");
    ReplacedSystemCalls replaced;
    replaced->fsetxattr = [](int, char const*, void const*, std::size_t, int) { return failWith(EOPNOTSUPP); };
    EXPECT_EQ(failureOf([&] { copyAtomic(); }), failure(ErrorCode::UnsupportedOperation, folder.iri(u"atomic")));
    EXPECT_EQ(std::distance(fs::directory_iterator(folder.path()), fs::directory_iterator()), 1);
    EXPECT_EQ(failureOf([&] { copyInPlace(); }), failure(ErrorCode::UnsupportedOperation, folder.iri(u"in place")));
}

} // namespace
} // namespace foundation::storage::local
