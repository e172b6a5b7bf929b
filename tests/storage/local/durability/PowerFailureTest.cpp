#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/RecordedSystemCalls.hpp>
#include <tests/storage/local/durability/PowerFailureModel.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <boost/property_tree/ptree.hpp>

#include <filesystem>
#include <functional>
#include <set>
#include <string>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::DiskEvent;
using tests::support::PowerFailureModel;
using tests::support::RecordedSystemCalls;
using tests::support::TemporaryFolder;

/// Writes several contents one after the other to "file", and keeps what happens to the disk. Each write is noted by
/// its content when it begins, and by "done" when the provider has answered.
class PowerFailure : public testing::Test
{
protected:
    PowerFailure() : model({folder.path()}) {}

    using Write = std::function<void(LocalProvider&, std::string const& content)>;

    void record(std::string const& durability, Write const& write)
    {
        folder.write("file", "0");
        model = PowerFailureModel({folder.path()});
        LocalProvider provider;
        boost::property_tree::ptree settings;
        settings.put("durability", durability);
        provider.configure(settings);
        RecordedSystemCalls record;
        for (char const* const content : {"1", "2", "3"}) {
            record.note(content);
            write(provider, content);
            record.note("done");
        }
        events = record.events();
    }

    /// What "file" must be one of after the first `count` events.
    std::set<std::string> allowed(std::size_t count, bool isDoneFinal) const
    {
        std::set<std::string> allowed{"0"};
        std::string last;
        for (std::size_t i = 0; i < count; ++i) {
            if (events[i].kind != DiskEvent::Kind::Note)
                continue;
            if (events[i].content != "done")
                allowed.insert(last = events[i].content);
            else if (isDoneFinal)
                allowed = {last};
        }
        return allowed;
    }

    /// How many outcomes of all power failures break the promise.
    int countBroken(bool isDoneFinal) const
    {
        int broken = 0;
        for (std::size_t count = 0; count <= events.size(); ++count) {
            std::set<std::string> const right = allowed(count, isDoneFinal);
            model.forEachOutcome(events, count, [&](PowerFailureModel::Outcome const& outcome) {
                auto const& found = outcome.at(folder.path().filename());
                auto const file = found.find("file");
                broken += file == found.end() || right.count(file->second) == 0;
            });
        }
        return broken;
    }

    TemporaryFolder const folder;
    TemporaryFolder const sources;
    PowerFailureModel model;
    std::vector<DiskEvent> events;

    Write const transaction = [this](LocalProvider& provider, std::string const& content) {
        auto const stream = provider.openTransactionalStream(folder.iri(u"file"), {});
        stream->write(content.data(), static_cast<long>(content.size()));
        stream->close(StreamClosePolicy::Commit);
    };

    Write const copy = [this](LocalProvider& provider, std::string const& content) {
        sources.write("source", content);
        provider.copyFileAtomic(sources.iri(u"source"), folder.iri(u"file"), ReplacementPolicy::Overwrite, {});
    };
};

TEST_F(PowerFailure, FindsTheNewContentOnceAFullCommitHasReturned)
{
    record("full", transaction);
    EXPECT_EQ(countBroken(true), 0);
}

TEST_F(PowerFailure, FindsTheNewContentOnceAFullAtomicCopyHasReturned)
{
    record("full", copy);
    EXPECT_EQ(countBroken(true), 0);
    record("file", copy);
    EXPECT_EQ(countBroken(false), 0);
    record("none", copy);
    EXPECT_GT(countBroken(false), 0);
}

TEST_F(PowerFailure, FindsOldOrNewContentWholeUnderFile)
{
    record("file", transaction);
    EXPECT_EQ(countBroken(false), 0);
    EXPECT_GT(countBroken(true), 0) << "nothing promises that the last content is the one found";
}

TEST_F(PowerFailure, MayTearTheContentUnderNone)
{
    record("none", transaction);
    EXPECT_GT(countBroken(false), 0);
}

TEST_F(PowerFailure, MayTearContentThatIsWrittenInPlace)
{
    record("full", [this](LocalProvider& provider, std::string const& content) {
        provider.openStream(folder.iri(u"file"), {})->write(content.data(), static_cast<long>(content.size()));
    });
    EXPECT_GT(countBroken(false), 0);
}

/// Whether every outcome of a move that has returned, or not, holds the file.
class PowerFailureDuringAMove : public testing::Test
{
protected:
    PowerFailureDuringAMove()
    {
        fs::create_directory(folder / "from");
        fs::create_directory(folder / "to");
        folder.write("from/file", "content");
    }

    TemporaryFolder const folder;
};

TEST_F(PowerFailureDuringAMove, NeverLosesTheFileAndFindsItAtTheTargetInTheEnd)
{
    PowerFailureModel const model({folder / "from", folder / "to"});
    LocalProvider const provider;
    RecordedSystemCalls record;
    provider.moveFile(folder.iri(u"from/file"), folder.iri(u"to/file"), ReplacementPolicy::Preserve);
    std::vector<DiskEvent> const events = record.events();
    for (std::size_t count = 0; count <= events.size(); ++count)
        model.forEachOutcome(events, count, [&](PowerFailureModel::Outcome const& outcome) {
            bool const isAtSource = outcome.count("from") != 0 && outcome.at("from").count("file") != 0;
            bool const isAtTarget = outcome.count("to") != 0 && outcome.at("to").count("file") != 0;
            EXPECT_TRUE(isAtSource || isAtTarget) << "after " << count << " events";
            EXPECT_TRUE(count < events.size() || (isAtTarget && !isAtSource));
        });
}

TEST_F(PowerFailureDuringAMove, WouldLoseTheFileIfTheFoldersWereSyncedTheOtherWayRound)
{
    PowerFailureModel const model({folder / "from", folder / "to"});
    LocalProvider const provider;
    RecordedSystemCalls record;
    provider.moveFile(folder.iri(u"from/file"), folder.iri(u"to/file"), ReplacementPolicy::Preserve);
    std::vector<DiskEvent> events = record.events();
    ASSERT_EQ(events.size(), 3u);
    std::swap(events[1], events[2]);
    int lost = 0;
    model.forEachOutcome(events, 2, [&](PowerFailureModel::Outcome const& outcome) { lost += outcome.empty(); });
    EXPECT_GT(lost, 0);
}

} // namespace
} // namespace foundation::storage::local
