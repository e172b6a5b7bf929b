#include <tools/storage/PlainFile.hpp>

#include <gtest/gtest.h>
#include <storage/provider/Exception.hpp>
#include <tests/support/MinimalProvider.hpp>

namespace {

using namespace foundation::storage::provider;
using foundation::storage::tool::PlainFile;
using foundation::storage::tool::Replace;
using foundation::tests::support::MinimalProvider;

class PlainFiles : public testing::Test
{
protected:
    PlainFiles() { store->folders.insert(StorageIRI(u"s://h/d")); }

    StorageIRI const location{u"s://h/d/f"};
    std::shared_ptr<MinimalProvider> const store = std::make_shared<MinimalProvider>();
    StorageItem const target{store, location};
};

TEST_F(PlainFiles, AreSeenWhileTheyAreWritten)
{
    PlainFile file(target, Replace::Never);
    file.write("content", 7);
    EXPECT_EQ(store->content(location), "content");
    file.commit(7);
    EXPECT_EQ(store->content(location), "content");
    EXPECT_EQ(store->files.size(), 1U);
}

TEST_F(PlainFiles, AreRemovedWhenANewOneIsDropped)
{
    PlainFile(target, Replace::Files).write("content", 7);
    EXPECT_TRUE(store->files.empty());
}

TEST_F(PlainFiles, KeepWhatWasWrittenIntoAnOldOne)
{
    store->put(location, "old content");
    PlainFile file(target, Replace::Files);
    file.write("new", 3);
    EXPECT_FALSE(file.discard());
    EXPECT_EQ(store->content(location), "new");
}

TEST_F(PlainFiles, AreNotReplacedUnlessTold)
{
    store->put(location, "old");
    EXPECT_THROW(PlainFile(target, Replace::Never), Exception);
    EXPECT_EQ(store->content(location), "old");
}

TEST_F(PlainFiles, FailAndLeaveNothingWhenTheSizeIsWrong)
{
    {
        PlainFile file(target, Replace::Never);
        file.write("content", 7);
        EXPECT_THROW(file.commit(8), Exception);
    }
    EXPECT_TRUE(store->files.empty());
}

} // namespace
