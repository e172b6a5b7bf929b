#include <tools/storage/CopyRun.hpp>

#include <gtest/gtest.h>
#include <storage/memory/MemoryProvider.hpp>
#include <tools/storage/TreeCopier.hpp>

namespace {

using namespace foundation::storage;
using namespace foundation::storage::tool;
using memory::MemoryProvider;
using provider::StorageIRI;
using provider::StorageItem;

Place root(std::u16string const& authority)
{
    StorageIRI const location(u"mem://" + authority + u"/");
    return Place(StorageItem(std::make_shared<MemoryProvider>(location), location), "");
}

void write(Place const& place, std::string const& content)
{
    auto const stream = place.item().openStream({});
    stream->write(content.data(), static_cast<long>(content.size()));
    stream->close();
}

std::string read(Place const& place)
{
    std::string content(1 << 20, '\0');
    long const size = place.item().openReadOnlyStream()->read(content.data(), static_cast<long>(content.size()));
    content.resize(size < 0 ? 0 : static_cast<std::size_t>(size));
    return content;
}

/// Copies from a store in memory to another, by several threads.
class CopyRunConcurrency : public testing::Test
{
protected:
    static constexpr int folders = 20;
    static constexpr int filesInEach = 100;

    CopyRunConcurrency()
    {
        for (int i = 0; i < folders; ++i) {
            Place const folder = source.child(numbered(i));
            folder.item().createFolder();
            for (int j = 0; j < filesInEach; ++j)
                write(folder.child(numbered(j)), std::to_string(i * j));
        }
    }

    static std::u16string numbered(int number)
    {
        std::string const text = std::to_string(number);
        return std::u16string(text.begin(), text.end());
    }

    /// Answers whether everything was copied.
    bool copy(CopyRunOptions options)
    {
        options.jobs = 4;
        CopyRun run(session, options);
        TreeCopier(session.stores(), run).copy(source, target.child(u"t"));
        return run.finish();
    }

    std::size_t countWrong() const
    {
        std::size_t count = 0;
        for (int i = 0; i < folders; ++i) {
            for (int j = 0; j < filesInEach; ++j)
                count += read(target.child(u"t").child(numbered(i)).child(numbered(j))) != std::to_string(i * j);
        }
        return count;
    }

    Session session{"cp"};
    Place const source = root(u"source");
    Place const target = root(u"target");
};

TEST_F(CopyRunConcurrency, CopiesATreeBetweenStores)
{
    EXPECT_TRUE(copy({}));
    EXPECT_EQ(countWrong(), 0U);
    EXPECT_EQ(session.status(), exitFine);
}

TEST_F(CopyRunConcurrency, CopiesInPlace)
{
    CopyRunOptions options;
    options.files.isInPlace = true;
    EXPECT_TRUE(copy(options));
    EXPECT_EQ(countWrong(), 0U);
}

TEST_F(CopyRunConcurrency, PassesOverWhatIsUpToDate)
{
    CopyRunOptions options;
    options.files.isUpdate = true;
    options.files.replace = Replace::Files;
    EXPECT_TRUE(copy(options));
    EXPECT_TRUE(copy(options));
    EXPECT_EQ(countWrong(), 0U);
}

TEST_F(CopyRunConcurrency, TellsWhatWasDoneWhenItIsStopped)
{
    CopyRunOptions options;
    options.jobs = 4;
    CopyRun run(session, options);
    TreeCopier(session.stores(), run).copy(source, target.child(u"t"));
    std::string const done = run.stop(true);
    EXPECT_NE(done.find(" of 2000 files copied, "), std::string::npos) << done;
}

TEST_F(CopyRunConcurrency, SaysOnceWhetherAllWasDone)
{
    CopyRun run(session, {.jobs = 4});
    testing::internal::CaptureStderr();
    run.fail(source, {"a", "failed"});
    EXPECT_FALSE(run.finish());
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "storage: cp: a: failed\n");
    EXPECT_TRUE(run.finish());
    EXPECT_EQ(session.status(), exitFailed);
}

} // namespace
