#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <algorithm>
#include <array>
#include <atomic>
#include <boost/any.hpp>
#include <boost/date_time/posix_time/posix_time.hpp>
#include <boost/property_tree/ptree.hpp>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <fcntl.h>
#include <filesystem>
#include <functional>
#include <map>
#include <string>
#include <string_view>
#include <sys/stat.h>
#include <thread>
#include <unistd.h>
#include <utility>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using namespace std::chrono_literals;
using tests::support::TemporaryFolder;
using Clock = std::chrono::steady_clock;

/// The slower the program, the less it does in its time; a sanitizer looks for other faults.
#if defined(__SANITIZE_THREAD__) || defined(__SANITIZE_ADDRESS__)
constexpr auto duration = 1s;
#else
constexpr auto duration = 20s;
#endif

/// How long what must happen at some time is waited for.
constexpr auto patience = 60s;

/// Exchanges two entries, again and again, while it lives.
class Swapper
{
public:
    Swapper(fs::path left, fs::path right)
        : thread_([this, left = std::move(left), right = std::move(right)](std::stop_token const& stop) {
              while (!stop.stop_requested()) {
                  if (::renameat2(AT_FDCWD, left.c_str(), AT_FDCWD, right.c_str(), RENAME_EXCHANGE) == 0)
                      ++swaps_;
              }
          })
    {
        while (swaps_ == 0)
            std::this_thread::yield();
    }

private:
    std::atomic<std::uint64_t> swaps_ = 0;
    std::jthread thread_;
};

/// A folder "place/tree/swapped" that is exchanged with the link "place/link" to the folder "outside".
class LocalProviderSwapConcurrency : public testing::Test
{
protected:
    LocalProviderSwapConcurrency()
    {
        fs::create_directories(folder / "outside/deep");
        fs::create_directories(folder / "outside/folder outside/deep");
        fs::create_directory(folder / "outside/empty outside");
        for (char const* const name : {"outside/who", "outside/known outside", "outside/deep/known outside"})
            folder.write(name, "outside");
        untouched = outside();
        makePlace();
    }

    void makePlace(std::string const& place = "place") const
    {
        fs::create_directories(folder / (place + "/tree/swapped/deep"));
        fs::create_directory_symlink(folder / "outside", folder / (place + "/link"));
        for (char const* const name : {"swapped/who", "swapped/within", "swapped/deep/within", "beside"})
            folder.write(place + "/tree/" + name, "within");
    }

    /// Puts a new place where the old one was, which becomes "used". Whoever swaps need not pause for that.
    void renewPlace() const
    {
        fs::remove_all(folder / "used");
        makePlace("used");
        ASSERT_EQ(
            ::renameat2(AT_FDCWD, (folder / "used").c_str(), AT_FDCWD, (folder / "place").c_str(), RENAME_EXCHANGE), 0);
    }

    Swapper swap() const { return Swapper(folder / "place/tree/swapped", folder / "place/link"); }

    /// What stands outside with its permissions, by path.
    std::map<std::string, std::string> outside() const
    {
        std::map<std::string, std::string> found;
        for (auto const& entry : fs::recursive_directory_iterator(folder / "outside")) {
            std::string const name = entry.path().lexically_relative(folder.path());
            auto const mode = std::to_string(static_cast<unsigned>(entry.status().permissions()));
            found[name] = mode + ' ' + (entry.is_regular_file() ? folder.read(name) : "");
        }
        return found;
    }

    /// Whether a program is led outside that first makes sure that no link stands there, and then goes by the path.
    bool isLedOutsideByPath() const
    {
        std::string const path = folder / "place/tree/swapped";
        struct stat status;
        if (::lstat(path.c_str(), &status) != 0 || !S_ISDIR(status.st_mode))
            return false;
        int const file = ::openat(AT_FDCWD, (path + "/who").c_str(), O_RDONLY | O_CLOEXEC);
        std::array<char, 16> content{};
        ssize_t const size = ::read(file, content.data(), content.size());
        ::close(file);
        return size > 0 && std::string_view(content.data(), static_cast<std::size_t>(size)) == "outside";
    }

    void expectSwappingToMatter() const
    {
        Swapper const swapper = swap();
        auto const end = Clock::now() + patience;
        bool isLedOutside = false;
        while (!isLedOutside && Clock::now() < end)
            isLedOutside = isLedOutsideByPath();
        ASSERT_TRUE(isLedOutside) << "nothing would be proved: looking before each access was enough";
    }

    TemporaryFolder folder;
    LocalProvider provider;
    std::map<std::string, std::string> untouched;
};

TEST_F(LocalProviderSwapConcurrency, LeadsNoRecursiveRemovalOutside)
{
    expectSwappingToMatter();
    int removed = 0;
    int kept = 0;
    Swapper const swapper = swap();
    auto const end = Clock::now() + duration;
    while (Clock::now() < end || removed == 0 || kept == 0) {
        ASSERT_LT(Clock::now(), end + patience)
            << removed << " times the folder was met, " << kept << " times the link";
        try {
            provider.removeFolderRecursively(folder.iri(u"place/tree"));
        } catch (Exception const&) {
            // Who is interfered with all the time need not come to an end.
        }
        renewPlace();
        bool const isKept = fs::exists(folder / "used/link/within") || fs::exists(folder / "used/tree/swapped/within");
        ++(isKept ? kept : removed);
        ASSERT_EQ(outside(), untouched);
    }
}

TEST_F(LocalProviderSwapConcurrency, LeadsNoRecursiveListingOutside)
{
    expectSwappingToMatter();
    int entered = 0;
    int passed = 0;
    Swapper const swapper = swap();
    auto const end = Clock::now() + duration;
    while (Clock::now() < end || entered == 0 || passed == 0) {
        ASSERT_LT(Clock::now(), end + patience) << entered << " times the folder was met, " << passed << " times not";
        bool isEntered = false;
        auto const listing = (entered + passed) % 2 == 0
                                 ? provider.listAllRecursive(folder.iri(u"place/tree"))
                                 : provider.listAllRecursiveNamesOnly(folder.iri(u"place/tree"));
        for (FolderEntry const& entry : entries(*listing)) {
            ASSERT_EQ(entry.getName().find(u"outside"), std::u16string::npos);
            isEntered = isEntered || entry.getName().ends_with(u"/within");
        }
        ++(isEntered ? entered : passed);
    }
}

/// What a provider that is confined to "place" does by way of the swapped folder.
class LocalProviderConfinedSwapConcurrency : public LocalProviderSwapConcurrency
{
protected:
    LocalProviderConfinedSwapConcurrency()
    {
        boost::property_tree::ptree settings;
        settings.put("root", (folder / "place").native());
        provider.configure(settings);
        folder.write("place/own", "within");
        struct stat status = {};
        EXPECT_EQ(::stat((folder / "outside/who").c_str(), &status), 0);
        inodeOutside = status.st_ino;
    }

    std::uint64_t inodeOutside = 0;

    StorageIRI swapped(std::u16string const& name) const { return folder.iri(u"place/tree/swapped/" + name); }

    std::string read(StorageIRI const& file) const
    {
        std::array<char, 16> content{};
        long const size = provider.openReadOnlyStream(file)->read(content.data(), content.size());
        return std::string(content.data(), size > 0 ? static_cast<std::size_t>(size) : 0);
    }

    void expectWithin(std::u16string_view name) const { EXPECT_EQ(name.find(u"outside"), std::u16string_view::npos); }

    void expectListedWithin(StorageIRI const& location) const
    {
        for (auto const list : {&IProvider::listAll, &IProvider::listAllNamesOnly, &IProvider::listAllRecursive}) {
            auto const listing = (provider.*list)(location, {});
            for (FolderEntry const& entry : entries(*listing))
                expectWithin(entry.getName());
        }
    }

    std::vector<std::function<void()>> operations()
    {
        auto const write = [](std::unique_ptr<ByteStream> const& stream) { stream->write("written", 7); };
        return {
            [this] { EXPECT_EQ(read(swapped(u"who")), "within"); },
            [this] { EXPECT_EQ(provider.getFileAttributes(swapped(u"who")).getSize(), 6U); },
            [this] { EXPECT_NE(provider.exists(swapped(u"known outside")), ExistenceType::AsFile); },
            [this] {
                EXPECT_NE(provider.existsExtended(swapped(u"known outside")), ExistenceTypeExtended::RegularFile);
            },
            [this] {
                expectListedWithin(folder.iri(u"place"));
                expectListedWithin(folder.iri(u"place/tree/swapped"));
            },
            [this, write] { write(provider.openStream(swapped(u"written"), {})); },
            [this] {
                auto const stream = provider.openTransactionalStream(swapped(u"who 2"), {});
                stream->write("within", 6);
                stream->close(StreamClosePolicy::Commit);
            },
            [this] { provider.createFile(swapped(u"made")); },
            [this] { provider.removeFile(swapped(u"made")); },
            [this] { provider.createFolder(swapped(u"made folder")); },
            [this] { provider.createFolderRecursive(swapped(u"made folder/deep/deeper")); },
            [this] { provider.removeFolder(swapped(u"made folder")); },
            [this] { provider.removeFolderRecursively(swapped(u"made folder")); },
            [this] { provider.removeFile(swapped(u"known outside")); },
            [this] { provider.removeFolderRecursively(swapped(u"folder outside")); },
            [this] { provider.removeFolder(swapped(u"empty outside")); },
            [this] { provider.moveFile(swapped(u"known outside"), swapped(u"gone"), ReplacementPolicy::Preserve); },
            [this] { provider.getFolderAttributes(swapped(u"deep")); },
            [this] {
                auto const inode = provider.getExtendedAttributes(swapped(u"who")).getAttribute("inode");
                EXPECT_NE(boost::any_cast<std::uint64_t>(inode), inodeOutside);
            },
            [this] {
                provider.copyFileAtomic(swapped(u"who"), folder.iri(u"place/atomic copy"), ReplacementPolicy::Overwrite,
                                        {});
                EXPECT_EQ(folder.read("place/atomic copy"), "within");
            },
            [this] {
                provider.copyFileAtomic(folder.iri(u"place/own"), swapped(u"copy 2"), ReplacementPolicy::Overwrite, {});
            },
            [this] { provider.moveFile(folder.iri(u"place/own"), swapped(u"own"), ReplacementPolicy::Overwrite); },
            [this] { provider.moveFile(swapped(u"own"), folder.iri(u"place/own"), ReplacementPolicy::Overwrite); },
            [this] { provider.moveFolder(swapped(u"deep"), swapped(u"deep 2"), ReplacementPolicy::Preserve); },
            [this] { provider.moveFolder(swapped(u"deep 2"), swapped(u"deep"), ReplacementPolicy::Preserve); },
            [this] {
                provider.copyFile(swapped(u"who"), folder.iri(u"place/copy"), ReplacementPolicy::Overwrite);
                EXPECT_EQ(folder.read("place/copy"), "within");
            },
            [this] { provider.copyFile(folder.iri(u"place/own"), swapped(u"copy"), ReplacementPolicy::Overwrite); },
            [this] { provider.setLastModified(swapped(u"who"), boost::posix_time::from_time_t(1)); },
            [this] { provider.setWritable(swapped(u"who"), false); },
            [this] { provider.setWritable(swapped(u"who"), true); },
        };
    }
};

TEST_F(LocalProviderConfinedSwapConcurrency, LeadsNoOperationOutside)
{
    expectSwappingToMatter();
    auto const timeOutside = fs::last_write_time(folder / "outside/who");
    auto const all = operations();
    std::vector<int> refused(all.size());
    std::uint64_t done = 0;
    auto const isEachRefused = [&] { return std::count(refused.begin(), refused.end(), 0) == 0; };
    Swapper const swapper = swap();
    auto const end = Clock::now() + duration;
    while (!HasFailure() && (Clock::now() < end || done == 0 || !isEachRefused())) {
        ASSERT_LT(Clock::now(), end + patience) << done << " within; refused: " << testing::PrintToString(refused);
        for (std::size_t i = 0; i < all.size(); ++i) {
            try {
                all[i]();
                ++done;
            } catch (Exception const& error) {
                refused[i] += error.getErrorCode() == ErrorCode::PermissionDenied ? 1 : 0;
            } catch (ByteStreamFailure const&) {
                // A stream may be closed when its file has been moved.
            }
        }
        ASSERT_EQ(outside(), untouched);
        ASSERT_EQ(fs::last_write_time(folder / "outside/who"), timeOutside);
    }
}

} // namespace
} // namespace foundation::storage::local
