#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <boost/any.hpp>
#include <boost/date_time/posix_time/ptime.hpp>
#include <boost/date_time/posix_time/time_parsers.hpp>
#include <boost/property_tree/ptree.hpp>

#include <array>
#include <cstdint>
#include <filesystem>
#include <string>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
namespace posix_time = boost::posix_time;
using namespace provider;
using posix_time::ptime;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

ptime timeOf(std::string const& text)
{
    return posix_time::from_iso_extended_string(text);
}

std::vector<std::string> namesOf(ExtendedAttributes const& attributes)
{
    std::vector<std::string> names;
    for (auto const& [name, value] : attributes)
        names.push_back(name);
    return names;
}

template <typename Value>
Value valueOf(ExtendedAttributes const& attributes, std::string const& name)
{
    return boost::any_cast<Value>(attributes.getAttribute(name));
}

class LocalProviderAttributes : public testing::Test
{
protected:
    LocalProviderAttributes()
    {
        folder.write("file", "content");
        fs::create_directory(folder / "folder");
        fs::create_symlink("file", folder / "link");
        fs::create_symlink("nothing", folder / "broken link");
        fs::permissions(folder / "file", fs::perms(0640));
        fs::permissions(folder / "folder", fs::perms(0750));
    }

    struct stat status(std::string const& name) const
    {
        struct stat result
        {};
        EXPECT_EQ(::lstat((folder / name).c_str(), &result), 0);
        return result;
    }

    unsigned modeOf(std::string const& name) const { return status(name).st_mode & 07777; }

    void setAttribute(std::string const& name, std::string const& value) const
    {
        ASSERT_EQ(::setxattr((folder / "file").c_str(), name.c_str(), value.data(), value.size(), 0), 0) << name;
    }

    ExtendedAttributes attributesOf(std::u16string const& name) const
    {
        return provider.getExtendedAttributes(folder.iri(name));
    }

    /// A provider that reaches nothing outside "folder".
    std::unique_ptr<LocalProvider> confined() const
    {
        boost::property_tree::ptree settings;
        settings.put("root", (folder / "folder").native());
        auto result = std::make_unique<LocalProvider>();
        result->configure(settings);
        return result;
    }

    TemporaryFolder folder;
    LocalProvider const provider;
};

TEST_F(LocalProviderAttributes, KeepTheTimeThatIsSetToTheMicrosecond)
{
    for (char const* const text : {"2024-02-29T23:59:59.999999", "1970-01-01T00:00:00", "1969-12-31T23:59:59.999999",
                                   "1901-12-14T00:00:00.000001", "2106-02-07T06:28:16.500000"})
    {
        provider.setLastModified(folder.iri(u"file"), timeOf(text));
        EXPECT_EQ(provider.getFileAttributes(folder.iri(u"file")).getLastModified(), timeOf(text));
        provider.setLastModified(folder.iri(u"folder"), timeOf(text));
        EXPECT_EQ(provider.getFolderAttributes(folder.iri(u"folder")).getLastModified(), timeOf(text));
    }
}

TEST_F(LocalProviderAttributes, KeepTheTimeOfTheLastAccessWhenATimeIsSet)
{
    std::array<timespec, 2> const times{timespec{1000, 42}, timespec{2000, 42}};
    ASSERT_EQ(::utimensat(AT_FDCWD, (folder / "file").c_str(), times.data(), 0), 0);
    provider.setLastModified(folder.iri(u"file"), timeOf("2001-02-03T04:05:06"));
    EXPECT_EQ(status("file").st_atim.tv_sec, 1000);
    EXPECT_EQ(status("file").st_atim.tv_nsec, 42);
}

TEST_F(LocalProviderAttributes, AreSetOfWhatALinkLeadsTo)
{
    provider.setLastModified(folder.iri(u"link"), timeOf("2001-02-03T04:05:06"));
    EXPECT_EQ(status("file").st_mtim.tv_sec, 981173106);
    EXPECT_GT(status("link").st_mtim.tv_sec, 981173106);
    provider.setWritable(folder.iri(u"link"), false);
    EXPECT_EQ(modeOf("file"), 0440u);
}

TEST_F(LocalProviderAttributes, TakeNoSpecialTime)
{
    std::time_t const before = status("file").st_mtim.tv_sec;
    for (auto const special :
         {boost::date_time::not_a_date_time, boost::date_time::pos_infin, boost::date_time::neg_infin})
        EXPECT_EQ(failureOf([&] { provider.setLastModified(folder.iri(u"file"), ptime(special)); }),
                  failure(ErrorCode::UnsupportedOperation, folder.iri(u"file")));
    EXPECT_EQ(status("file").st_mtim.tv_sec, before);
}

TEST_F(LocalProviderAttributes, TakeTheEndsOfTheCalendarOrWhatIsNearest)
{
    for (auto const end : {boost::date_time::min_date_time, boost::date_time::max_date_time}) {
        ReplacedSystemCalls replaced;
        static std::int64_t seconds;
        replaced->utimensat = [](int, char const*, timespec const* times, int) {
            seconds = times[1].tv_sec;
            return 0;
        };
        provider.setLastModified(folder.iri(u"file"), ptime(end));
        EXPECT_EQ(seconds, end == boost::date_time::min_date_time ? -17'987'443'200 : 253'402'300'799);
    }
    provider.setLastModified(folder.iri(u"file"), ptime(boost::date_time::min_date_time));
    EXPECT_LT(provider.getFileAttributes(folder.iri(u"file")).getLastModified(), timeOf("1970-01-01T00:00:01"));
}

TEST_F(LocalProviderAttributes, TakeAllWriteBitsAndGiveTheOwnersBack)
{
    fs::permissions(folder / "file", fs::perms(0666));
    provider.setWritable(folder.iri(u"file"), false);
    EXPECT_EQ(modeOf("file"), 0444u);
    provider.setWritable(folder.iri(u"file"), true);
    EXPECT_EQ(modeOf("file"), 0644u);
}

TEST_F(LocalProviderAttributes, KeepTheOtherBitsWhenWritabilityIsSet)
{
    ASSERT_EQ(::chmod((folder / "folder").c_str(), 03775), 0);
    provider.setWritable(folder.iri(u"folder"), false);
    EXPECT_EQ(modeOf("folder"), 03555u);
    provider.setWritable(folder.iri(u"folder"), true);
    EXPECT_EQ(modeOf("folder"), 03755u);
}

TEST_F(LocalProviderAttributes, AreSetOfAFileThatMayNotBeRead)
{
    fs::permissions(folder / "file", fs::perms(0));
    provider.setWritable(folder.iri(u"file"), true);
    EXPECT_EQ(modeOf("file"), 0200u);
}

TEST_F(LocalProviderAttributes, AreSetOfWhatExistsOnly)
{
    for (char16_t const* const name : {u"missing", u"missing/inner", u"file/inner", u"broken link"}) {
        StorageIRI const iri = folder.iri(name);
        auto const missing = failure(ErrorCode::ResourceNotFound, iri);
        EXPECT_EQ(failureOf([&] { provider.setLastModified(iri, timeOf("2001-02-03T04:05:06")); }), missing);
        EXPECT_EQ(failureOf([&] { provider.setWritable(iri, false); }), missing);
        EXPECT_EQ(failureOf([&] { provider.getExtendedAttributes(iri); }), missing);
    }
}

TEST_F(LocalProviderAttributes, AreToldAsTheSystemHasThem)
{
    fs::create_hard_link(folder / "file", folder / "second name");
    struct stat const expected = status("file");
    ExtendedAttributes const attributes = attributesOf(u"link");
    EXPECT_EQ(valueOf<std::uint32_t>(attributes, "mode"), 0640u);
    EXPECT_EQ(valueOf<std::uint32_t>(attributes, "uid"), ::geteuid());
    EXPECT_EQ(valueOf<std::uint32_t>(attributes, "gid"), expected.st_gid);
    EXPECT_EQ(valueOf<std::uint32_t>(attributes, "links"), 2u);
    EXPECT_EQ(valueOf<std::uint64_t>(attributes, "inode"), expected.st_ino);
    EXPECT_EQ(valueOf<std::uint64_t>(attributes, "device"), expected.st_dev);
    EXPECT_EQ(valueOf<std::uint64_t>(attributes, "allocated"), static_cast<std::uint64_t>(expected.st_blocks) * 512);
    EXPECT_EQ(valueOf<ptime>(attributes, "accessTime"), timeOf("1970-01-01T00:00:00") +
                                                            posix_time::seconds(expected.st_atim.tv_sec) +
                                                            posix_time::microseconds(expected.st_atim.tv_nsec / 1000));
    EXPECT_EQ(valueOf<ptime>(attributes, "changeTime"), timeOf("1970-01-01T00:00:00") +
                                                            posix_time::seconds(expected.st_ctim.tv_sec) +
                                                            posix_time::microseconds(expected.st_ctim.tv_nsec / 1000));
}

TEST_F(LocalProviderAttributes, OfAFolderAreTold)
{
    EXPECT_EQ(valueOf<std::uint32_t>(attributesOf(u"folder"), "mode"), 0750u);
    EXPECT_EQ(valueOf<std::uint32_t>(attributesOf(u"folder"), "links"), status("folder").st_nlink);
}

TEST_F(LocalProviderAttributes, HoldTheTimeOfBirthWhereTheFileSystemKeepsIt)
{
    static unsigned kept;
    ReplacedSystemCalls replaced;
    replaced->statx = [](int at, char const* path, int flags, unsigned mask, struct statx* result) {
        int const answer = ::statx(at, path, flags, mask, result);
        result->stx_mask = (result->stx_mask & ~unsigned{STATX_BTIME}) | kept;
        result->stx_btime.tv_sec = 1'234'567'890;
        result->stx_btime.tv_nsec = 123'456'789;
        return answer;
    };
    kept = STATX_BTIME;
    EXPECT_EQ(valueOf<ptime>(attributesOf(u"file"), "birthTime"), timeOf("2009-02-13T23:31:30.123456"));
    kept = 0;
    EXPECT_FALSE(attributesOf(u"file").hasAttribute("birthTime"));
}

TEST_F(LocalProviderAttributes, HoldThoseOfTheUser)
{
    std::string const bytes("\0\xff\n", 3);
    setAttribute("user.empty", "");
    setAttribute("user.bytes", bytes);
    setAttribute("user.long", std::string(2000, 'x'));
    ExtendedAttributes const attributes = attributesOf(u"file");
    EXPECT_EQ(valueOf<std::string>(attributes, "user.empty"), "");
    EXPECT_EQ(valueOf<std::string>(attributes, "user.bytes"), bytes);
    EXPECT_EQ(valueOf<std::string>(attributes, "user.long"), std::string(2000, 'x'));
}

TEST_F(LocalProviderAttributes, CannotBeHiddenByThoseOfTheUser)
{
    setAttribute("user.mode", "mine");
    EXPECT_EQ(valueOf<std::uint32_t>(attributesOf(u"file"), "mode"), 0640u);
    EXPECT_EQ(valueOf<std::string>(attributesOf(u"file"), "user.mode"), "mine");
}

/// Answers a list of two attributes, whatever the file.
ssize_t listTwo(char const*, char* list, std::size_t size)
{
    static constexpr char names[] = "security.label\0user.first\0user.second";
    if (size < sizeof names)
        return failWith(ERANGE);
    std::copy(std::begin(names), std::end(names), list);
    return sizeof names;
}

TEST_F(LocalProviderAttributes, PassOverThoseThatAreGoneMeanwhileOrMayNotBeRead)
{
    static int error;
    auto const before = namesOf(attributesOf(u"file"));
    ReplacedSystemCalls replaced;
    replaced->listxattr = listTwo;
    replaced->getxattr = [](char const*, char const* name, void* value, std::size_t) -> ssize_t {
        if (std::string(name) == "user.first")
            return failWith(error);
        *static_cast<char*>(value) = '2';
        return 1;
    };
    for (int const passedOver : {ENODATA, EACCES, EPERM}) {
        error = passedOver;
        ExtendedAttributes const attributes = attributesOf(u"file");
        EXPECT_EQ(namesOf(attributes).size(), before.size() + 1);
        EXPECT_EQ(valueOf<std::string>(attributes, "user.second"), "2");
    }
    error = EIO;
    EXPECT_EQ(failureOf([&] { attributesOf(u"file"); }), failure(ErrorCode::IOError, folder.iri(u"file")));
}

TEST_F(LocalProviderAttributes, AreReadByCallsThatHaveRoomForAll)
{
    ReplacedSystemCalls replaced;
    static std::size_t least;
    least = SIZE_MAX;
    replaced->listxattr = [](char const* path, char* list, std::size_t size) {
        least = std::min(least, size);
        return listTwo(path, list, size);
    };
    replaced->getxattr = [](char const*, char const*, void*, std::size_t size) -> ssize_t {
        least = std::min(least, size);
        return 0;
    };
    attributesOf(u"file");
    EXPECT_EQ(least, 65536u);
}

TEST_F(LocalProviderAttributes, HoldNoneOfTheUserWhereTheFileSystemOrProcDoesNotServeThem)
{
    setAttribute("user.name", "value");
    static int error;
    ReplacedSystemCalls replaced;
    replaced->listxattr = [](char const*, char*, std::size_t) -> ssize_t { return failWith(error); };
    for (int const none : {EOPNOTSUPP, ENOENT}) {
        error = none;
        EXPECT_FALSE(attributesOf(u"file").hasAttribute("user.name"));
        EXPECT_TRUE(attributesOf(u"file").hasAttribute("mode"));
    }
}

TEST_F(LocalProviderAttributes, OfAnExistingFileAreNeverFoundMissingForWantOfProc)
{
    ReplacedSystemCalls replaced;
    replaced->fchmodat = [](int, char const*, mode_t, int) { return failWith(ENOENT); };
    EXPECT_EQ(failureOf([&] { provider.setWritable(folder.iri(u"file"), false); }),
              failure(ErrorCode::UnsupportedOperation, folder.iri(u"file")));
}

TEST_F(LocalProviderAttributes, AreReachedBeneathARoot)
{
    folder.write("folder/file", "content");
    auto const inside = confined();
    StorageIRI const file = folder.iri(u"folder/file");
    inside->setLastModified(file, timeOf("2001-02-03T04:05:06"));
    EXPECT_EQ(status("folder/file").st_mtim.tv_sec, 981173106);
    inside->setWritable(file, false);
    EXPECT_EQ(modeOf("folder/file") & 0222, 0u);
    EXPECT_EQ(valueOf<std::uint64_t>(inside->getExtendedAttributes(file), "inode"), status("folder/file").st_ino);
    EXPECT_EQ(valueOf<std::uint64_t>(inside->getExtendedAttributes(folder.iri(u"folder")), "inode"),
              status("folder").st_ino);
}

TEST_F(LocalProviderAttributes, AreNotReachedByALinkOutOfARoot)
{
    fs::create_symlink("../file", folder / "folder/out");
    auto const inside = confined();
    for (StorageIRI const& iri : {folder.iri(u"folder/out"), folder.iri(u"file"), folder.iri(u"folder/../file")}) {
        auto const denied = failure(ErrorCode::PermissionDenied, iri);
        EXPECT_EQ(failureOf([&] { inside->setLastModified(iri, timeOf("2001-02-03T04:05:06")); }), denied);
        EXPECT_EQ(failureOf([&] { inside->setWritable(iri, false); }), denied);
        EXPECT_EQ(failureOf([&] { inside->getExtendedAttributes(iri); }), denied);
    }
    EXPECT_EQ(modeOf("file"), 0640u);
    EXPECT_GT(status("file").st_mtim.tv_sec, 981173106);
}

} // namespace
} // namespace foundation::storage::local
