// Whether what is told is all that happens.

#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <fl/filesystem/native_name.hpp>
#include <tests/storage/local/WatchedFolder.hpp>

#include <filesystem>
#include <fstream>
#include <map>
#include <mutex>
#include <random>
#include <set>
#include <string>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using events::EntryType;
using events::Kind;

constexpr int changeCount = 20'000;
constexpr int changesBetweenLooks = 500;

/// Paths relative to a folder; those of folders end in a slash.
using Names = std::set<std::string>;

std::string slashed(std::string path, bool isFolder)
{
    return isFolder ? path + '/' : path;
}

void addEntriesOf(fs::path const& base, fs::path const& folder, Names& names)
{
    for (fs::directory_entry const& entry : fs::directory_iterator(base / folder))
        names.insert(slashed((folder / entry.path().filename()).native(), entry.is_directory()));
}

/// Keeps a listing of several folders by what is told of them, and lists again when it is told to.
class Listing
{
public:
    explicit Listing(fs::path base) : base_(std::move(base)) {}

    void follow(Kind kind, StorageIRI const& first, StorageIRI const& second, EntryType type,
                boost::property_tree::ptree const& details)
    {
        std::scoped_lock const lock(mutex_);
        bool const isFolder = type == EntryType::Folder;
        ++told;
        if (details.get("overflow", false))
            return listAgain(relative(first));
        if (kind == Kind::Created)
            names_.insert(slashed(relative(first), isFolder));
        else if (kind == Kind::Removed)
            names_.erase(slashed(relative(first), isFolder));
        else if (kind == Kind::Moved && names_.erase(slashed(relative(first), isFolder)) != 0)
            names_.insert(slashed(relative(second), isFolder));
    }

    Names names() const
    {
        std::scoped_lock const lock(mutex_);
        return names_;
    }

    int told = 0;
    int overflows = 0;

private:
    std::string relative(StorageIRI const& location) const
    {
        return fs::path(fl::filesystem::to_native_bytes(location.getPath())).lexically_relative(base_).native();
    }

    void listAgain(std::string const& folder)
    {
        ++overflows;
        std::erase_if(names_, [&](std::string const& name) {
            return name.starts_with(folder + '/') && name.find('/', folder.size() + 1) >= name.size() - 1;
        });
        addEntriesOf(base_, folder, names_);
    }

    fs::path base_;
    mutable std::mutex mutex_; ///< the sanitizer does not see that an event comes after its change
    Names names_;
};

/// Makes changes of all kinds in some folders. What cannot be done is no change.
class Changes
{
public:
    Changes(fs::path base, std::vector<std::string> folders, unsigned seed)
        : base_(std::move(base)), folders_(std::move(folders)), random_(seed)
    {}

    void makeOne()
    {
        fs::path const path = somewhere();
        std::error_code refused;
        switch (pick(8)) {
        case 0:
        case 1:
            std::ofstream(path, std::ios::app) << "content";
            break;
        case 2:
            fs::create_directory(path, refused);
            break;
        case 3:
            fs::remove(path, refused); // also empty folders
            break;
        case 4:
            fs::permissions(path, fs::perms::owner_all, refused);
            break;
        default:
            fs::rename(path, somewhere(), refused);
        }
    }

private:
    unsigned pick(std::size_t count) { return static_cast<unsigned>(random_() % count); }
    fs::path somewhere() { return base_ / folders_[pick(folders_.size())] / std::to_string(pick(40)); }

    fs::path base_;
    std::vector<std::string> folders_;
    std::mt19937 random_;
};

class LocalProviderEventsRandomConcurrency : public tests::support::WatchedFolder
{};

TEST_F(LocalProviderEventsRandomConcurrency, TellAllThatHappens)
{
    constexpr unsigned seed = 20'240;
    SCOPED_TRACE(seed);
    std::vector<std::string> const watched{"a", "b", "b/sub"};
    Listing listing(folder.path());
    for (std::string const& name : watched) {
        makeFolder(name);
        provider->publishFolderEventsFor(
            at(fl::filesystem::from_native_bytes(name)),
            [&](auto const& kind, auto const& first, auto const& second, auto const& type, auto const& details) {
                listing.follow(kind, first, second, type, details);
            },
            tests::support::allEventKinds());
    }
    makeFolder("elsewhere");
    folder.write("b/told by the watch of b", "");
    Changes changes(folder.path(), {"a", "b", "b/sub", "elsewhere"}, seed);
    Names expected;
    for (int i = 1; i <= changeCount; ++i) {
        changes.makeOne();
        if (i % changesBetweenLooks != 0)
            continue;
        settle();
        expected.clear();
        for (std::string const& name : watched)
            addEntriesOf(folder.path(), name, expected);
        Names found = listing.names();
        found.insert("b/sub/"); // was there before
        ASSERT_EQ(found, expected) << "after " << i << " changes";
    }
    EXPECT_EQ(listing.overflows, 0) << "listing again proves nothing";
    EXPECT_GT(listing.told, changeCount / 2);
    EXPECT_GT(expected.size(), 20U);
    provider->shutdown();
}

} // namespace
} // namespace foundation::storage::local
