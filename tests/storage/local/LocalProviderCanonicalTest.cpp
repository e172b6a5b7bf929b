#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <tests/support/TemporaryFolder.hpp>

#include <filesystem>
#include <string>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::TemporaryFolder;

class LocalProviderCanonical : public testing::Test
{
protected:
    LocalProviderCanonical()
    {
        fs::create_directories(folder / "x");
        fs::create_directories(folder / "y/deep");
        folder.write("x/a", "x");
        folder.write("y/a", "y");
        fs::create_symlink("../y/deep", folder / "x/link");
        fs::create_symlink("../y/a", folder / "x/b");
        fs::create_symlink("missing", folder / "x/broken");
        fs::create_symlink("loop", folder / "x/loop");
    }

    StorageIRI canonical(std::u16string const& path) const { return provider.getCanonicalLocation(folder.iri(path)); }

    /// The one location of a path below the folder, whose own path may hold links.
    StorageIRI real(std::string const& path) const
    {
        return StorageIRI(StorageIRI(u"file:///"),
                          fl::filesystem::from_native_bytes((fs::canonical(folder.path()) / path).native()));
    }

    TemporaryFolder folder;
    LocalProvider provider;
};

TEST_F(LocalProviderCanonical, FollowsLinksBeforeItGoesUp)
{
    EXPECT_EQ(canonical(u"x/link/../a"), real("y/a"));
    EXPECT_EQ(canonical(u"x/a"), real("x/a"));
    EXPECT_EQ(canonical(u"x/./../x//a/"), real("x/a"));
}

TEST_F(LocalProviderCanonical, IsThatOfTheTargetOfALink)
{
    EXPECT_EQ(canonical(u"x/b"), real("y/a"));
    EXPECT_EQ(canonical(u"x/link"), real("y/deep"));
}

TEST_F(LocalProviderCanonical, OfWhatIsMissingGoesAsFarAsItExists)
{
    EXPECT_EQ(canonical(u"x/link/new"), real("y/deep/new"));
    EXPECT_EQ(canonical(u"x/link/new/newer"), real("y/deep/new/newer"));
    EXPECT_EQ(canonical(u"x/link/new/../newer"), real("y/deep/new/../newer"));
    EXPECT_EQ(canonical(u"x/broken"), real("x/broken"));
    EXPECT_EQ(canonical(u"x/link/../a/below"), real("y/a/below"));
    EXPECT_EQ(canonical(u"x/loop/b"), real("x/loop/b"));
}

TEST_F(LocalProviderCanonical, IsTheSameForEverySpelling)
{
    std::u16string const path = folder.iri(u"x/a").getPath();
    for (std::u16string const text : {u"file:", u"file://", u"file://localhost", u"FILE://"})
        EXPECT_EQ(provider.getCanonicalLocation(StorageIRI(text + path)).toString(), real("x/a").toString())
            << text.size();
    EXPECT_EQ(provider.getCanonicalLocation(StorageIRI(u"file", fl::filesystem::upath(path))).toString(),
              real("x/a").toString());
}

TEST_F(LocalProviderCanonical, OfTheRootIsTheRoot)
{
    EXPECT_EQ(provider.getCanonicalLocation(StorageIRI(u"file:///")), StorageIRI(u"file:///"));
    EXPECT_EQ(provider.getCanonicalLocation(StorageIRI(u"file:///no-such-folder-at-all/a")),
              StorageIRI(u"file:///no-such-folder-at-all/a"));
}

TEST_F(LocalProviderCanonical, KeepsNamesThatAreNotText)
{
    folder.write("x/\xFF#?", "");
    StorageIRI const location = folder.iri(u"x/\uEFFF#?");
    ASSERT_TRUE(provider.fileExists(location));
    EXPECT_TRUE(provider.fileExists(provider.getCanonicalLocation(location)));
}

TEST_F(LocalProviderCanonical, OfWhatIsNoLocalFileIsWhatItsTextSays)
{
    EXPECT_EQ(provider.getCanonicalLocation(StorageIRI(u"other://host/a/../b")), StorageIRI(u"other://host/b"));
}

TEST_F(LocalProviderCanonical, StaysBeneathAFolderThatWasOpenedThroughALink)
{
    fs::create_directory_symlink(folder.path(), folder / "top");
    fs::create_symlink("/etc/passwd", folder / "x/outside");
    boost::property_tree::ptree settings;
    settings.put("root", (folder / "top").string());
    provider.configure(settings);
    StorageIRI const top = folder.iri(u"top");
    auto const in = [&](std::u16string const& path) { return StorageIRI(top, path); };
    EXPECT_EQ(provider.getCanonicalLocation(in(u"x/link/../a")), in(u"y/a"));
    EXPECT_EQ(provider.getCanonicalLocation(in(u"x/new")), in(u"x/new"));
    EXPECT_EQ(provider.getCanonicalLocation(top), top);
    EXPECT_EQ(provider.getCanonicalLocation(in(u"x/../x/outside")), in(u"x/outside"));
    EXPECT_EQ(provider.getCanonicalLocation(folder.iri(u"x/link/../a")), folder.iri(u"x/a"));
}

} // namespace
} // namespace foundation::storage::local
