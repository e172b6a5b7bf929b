#pragma once

#include <gtest/gtest.h>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/LocalProvider.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <filesystem>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

namespace foundation::tests::support {

inline std::vector<storage::events::Kind> allEventKinds()
{
    using storage::events::Kind;
    return {Kind::Created, Kind::Removed, Kind::Modified, Kind::AttributesChanged, Kind::Moved};
}

/// Puts events into words, such as "created file a" or "moved folder a to b/c", with paths relative to a folder, and
/// collects them.
class EventTexts
{
public:
    explicit EventTexts(std::filesystem::path base) : base_(std::move(base)) {}

    storage::provider::ChangeEventCallback callback()
    {
        return [this](storage::events::Kind const& kind, storage::provider::StorageIRI const& first,
                      storage::provider::StorageIRI const& second, storage::events::EntryType const& type,
                      boost::property_tree::ptree const& details) {
            std::string text = describe(kind, first, second, type, details);
            std::lock_guard const lock(mutex_);
            texts_.push_back(std::move(text));
            arrival_.notify_all();
        };
    }

    bool waitFor(std::string const& text)
    {
        std::unique_lock lock(mutex_);
        return arrival_.wait_for(lock, std::chrono::seconds(60),
                                 [&] { return std::find(texts_.begin(), texts_.end(), text) != texts_.end(); });
    }

    std::vector<std::string> take()
    {
        std::lock_guard const lock(mutex_);
        return std::exchange(texts_, {});
    }

private:
    std::string describe(storage::events::Kind kind, storage::provider::StorageIRI const& first,
                         storage::provider::StorageIRI const& second, storage::events::EntryType type,
                         boost::property_tree::ptree const& details) const
    {
        static constexpr char const* kinds[] = {"created ", "removed ", "modified ", "attributes ", "moved "};
        static constexpr char const* types[] = {"file ", "folder ", "unknown "};
        std::string text = kinds[static_cast<int>(kind)];
        text.append(types[static_cast<int>(type)]).append(relative(first));
        if (first != second)
            text.append(" to ").append(relative(second));
        for (auto const& [name, value] : details)
            text.append(" ").append(name).append("=").append(value.data());
        return text;
    }

    std::string relative(storage::provider::StorageIRI const& location) const
    {
        std::filesystem::path const path = fl::filesystem::to_native_bytes(location.getPath());
        return path.lexically_relative(base_).native();
    }

    std::filesystem::path base_;
    std::mutex mutex_;
    std::condition_variable arrival_;
    std::vector<std::string> texts_;
};

/// A folder, a provider that watches it, and what it tells.
class WatchedFolder : public testing::Test
{
protected:
    using Kinds = std::vector<storage::events::Kind>;
    using Texts = std::vector<std::string>;

    storage::provider::StorageIRI at(std::u16string const& name) const { return folder.iri(name); }

    void watchFolder(std::u16string const& name, Kinds const& kinds = allEventKinds())
    {
        provider->publishFolderEventsFor(at(name), log.callback(), kinds);
    }

    void watchFile(std::u16string const& name, Kinds const& kinds = allEventKinds())
    {
        provider->publishFileEventsFor(at(name), log.callback(), kinds);
    }

    void makeFolder(std::string const& name) const { std::filesystem::create_directory(folder / name); }
    void remove(std::string const& name) const { std::filesystem::remove(folder / name); }
    void rename(std::string const& from, std::string const& to) const
    {
        std::filesystem::rename(folder / from, folder / to);
    }

    /// Waits until all that has happened so far is told: what happens in one folder is told before what happens later
    /// in another.
    void settle()
    {
        storage::provider::StorageIRI const mark = marks.iri(u"mark");
        EventTexts told(marks.path());
        provider->publishFileEventsFor(mark, told.callback(), {storage::events::Kind::Created});
        marks.write("mark", "");
        EXPECT_TRUE(told.waitFor("created file mark"));
        std::filesystem::remove(marks / "mark");
        provider->stopPublishingFileEventsFor(mark);
    }

    Texts told()
    {
        settle();
        return log.take();
    }

    TemporaryFolder const marks;
    TemporaryFolder const folder;
    EventTexts log{folder.path()};
    std::shared_ptr<storage::local::LocalProvider> provider = std::make_shared<storage::local::LocalProvider>();
};

} // namespace foundation::tests::support
