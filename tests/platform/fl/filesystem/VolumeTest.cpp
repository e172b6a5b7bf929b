#include <fl/filesystem/volume.hpp>

#include <gtest/gtest.h>

#include <fcntl.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <string>

#include <fl/filesystem/exceptions.hpp>
#include <fl/filesystem/native_name.hpp>

namespace fl::filesystem {
namespace {

// A folder of its own for each test, by its path without links.
class Volume : public testing::Test
{
protected:
    Volume()
    {
        std::string pattern = std::filesystem::canonical(std::filesystem::temp_directory_path()) / "volume-XXXXXX";
        if (::mkdtemp(pattern.data()) == nullptr) {
            throw std::runtime_error("no temporary folder");
        }
        folder_ = pattern;
    }
    ~Volume() override { std::filesystem::remove_all(folder_); }

    std::string inside(std::string const& name) const { return folder_.string() + "/" + name; }
    void makeFile(std::string const& name) const { std::ofstream(inside(name)) << name; }
    void makeFolder(std::string const& name) const { std::filesystem::create_directory(inside(name)); }
    void makeLink(std::string const& name, std::string const& target) const
    {
        std::filesystem::create_symlink(target, inside(name));
    }

    std::filesystem::path folder_;
};

// Gives up the rights of the superuser, who may look everywhere, for a while.
class OrdinaryUser
{
public:
    OrdinaryUser() : previous_(::geteuid())
    {
        if (previous_ == 0 && ::seteuid(65534) != 0) {
            throw std::runtime_error("no ordinary user to become");
        }
    }
    OrdinaryUser(OrdinaryUser const&) = delete;
    OrdinaryUser& operator=(OrdinaryUser const&) = delete;
    ~OrdinaryUser()
    {
        if (::seteuid(previous_) != 0) {
            std::abort();
        }
    }

private:
    uid_t previous_;
};

upath pathOf(std::string const& bytes)
{
    return upath(from_native_bytes(bytes), false);
}

std::string resolved(std::string const& bytes)
{
    return to_native_bytes(get_pathname_from_volume(pathOf(bytes), upath()).string());
}

void resolve(upath const& path)
{
    static_cast<void>(get_pathname_from_volume(path, upath()));
}

TEST_F(Volume, KeepsAPathThatIsCanonical)
{
    makeFile("file");
    EXPECT_EQ(resolved(inside("file")), inside("file"));
    EXPECT_EQ(resolved("/"), "/");
}

TEST_F(Volume, ResolvesDotsAndSeparators)
{
    makeFolder("a");
    makeFile("a/file");
    EXPECT_EQ(resolved(inside("a//.././a/file")), inside("a/file"));
    EXPECT_EQ(resolved(inside("a//")), inside("a"));
    EXPECT_EQ(resolved("/.."), "/");
}

TEST_F(Volume, ResolvesLinks)
{
    makeFolder("a");
    makeFile("a/file");
    makeLink("folder-link", "a");
    makeLink("link", inside("folder-link/file"));
    EXPECT_EQ(resolved(inside("link")), inside("a/file"));
    EXPECT_EQ(resolved(inside("folder-link/../a")), inside("a"));
}

TEST_F(Volume, FindsNamesThatAreNotUtf8)
{
    for (std::string const name : {"\xFF\xC3", "caf\xC3\xA9", "\xEE\xBE\x80", "a b%41\n"}) {
        makeFile(name);
        EXPECT_EQ(resolved(inside(name)), inside(name));
    }
    makeLink("link", "\xFF\xC3");
    EXPECT_EQ(get_pathname_from_volume(pathOf(inside("link")), upath()),
              upath(from_native_bytes(folder_.string()) + u"/\uEFFF\uEFC3"));
}

TEST_F(Volume, LooksAtTheOneTreeWhateverTheVolume)
{
    makeFile("file");
    EXPECT_EQ(get_pathname_from_volume(pathOf(inside("file")), upath(u"/nowhere")), pathOf(inside("file")));
}

TEST_F(Volume, MissingThingsAreNotFound)
{
    makeFile("file");
    makeLink("broken", "nothing");
    EXPECT_THROW(resolve(pathOf(inside("missing"))), PathNotFound);
    EXPECT_THROW(resolve(pathOf(inside("missing/deeper"))), PathNotFound);
    EXPECT_THROW(resolve(pathOf(inside("broken"))), PathNotFound);
    EXPECT_THROW(resolve(pathOf(inside("file/below"))), PathNotFound);
}

TEST_F(Volume, FoldersThatMayNotBeEnteredDenyAccess)
{
    makeFolder("closed");
    makeFile("closed/file");
    std::filesystem::permissions(folder_, std::filesystem::perms::all);
    std::filesystem::permissions(inside("closed"), std::filesystem::perms::none);
    {
        OrdinaryUser const user;
        EXPECT_THROW(resolve(pathOf(inside("closed/file"))), AccessDenied);
    }
    std::filesystem::permissions(inside("closed"), std::filesystem::perms::owner_all);
}

TEST_F(Volume, LoopsAreInvalid)
{
    makeLink("loop", "loop");
    EXPECT_THROW(resolve(pathOf(inside("loop"))), InvalidArgument);
}

TEST_F(Volume, NamesThatAreTooLongAreInvalid)
{
    EXPECT_THROW(resolve(pathOf(inside(std::string(256, 'x')))), InvalidArgument);
}

TEST_F(Volume, LongPathsAreResolvedToWhatTheyMean)
{
    std::string path;
    while (path.size() < 100000) {
        path += "/.";
    }
    EXPECT_EQ(resolved(path), "/");
}

TEST_F(Volume, RelativePathsAreInvalidWhereverTheProcessStands)
{
    for (std::u16string const text : {u"", u".", u"..", u"etc", u"./etc"}) {
        EXPECT_THROW(resolve(upath(text)), InvalidArgument);
        EXPECT_THROW(static_cast<void>(get_pathname_from_volume(upath(text), upath(u"/"))), InvalidArgument);
    }
}

TEST_F(Volume, TextThatNoPathCanBeIsInvalid)
{
    EXPECT_THROW(resolve(upath(std::u16string(u"/etc\0x", 6))), InvalidArgument);
    EXPECT_THROW(resolve(upath(std::u16string{u'/', char16_t{0xD800}})), InvalidArgument);
}

TEST_F(Volume, MessageNamesThePathAndTheReason)
{
    try {
        resolve(upath(u"/no such caf\u00E9"));
        FAIL() << "nothing was thrown";
    } catch (PathNotFound const& error) {
        EXPECT_STREQ(error.what(), "'/no such caf\xC3\xA9': No such file or directory");
    }
}

} // namespace
} // namespace fl::filesystem
