#include <tools/storage/FileCopier.hpp>

#include <gtest/gtest.h>
#include <storage/provider/Exception.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tools/storage/Failure.hpp>

namespace {

using namespace foundation::storage;
using namespace foundation::storage::tool;
using foundation::tests::support::MinimalProvider;
using foundation::tests::support::RecordingByteStream;

/// A store of one file, read through a stream that does as it is told.
class Source final : public MinimalProvider
{
public:
    std::function<long(char*, long)> onRead;

protected:
    std::unique_ptr<provider::ByteStream> doOpenReadOnlyStream(provider::StorageIRI const&) const override
    {
        auto stream = std::make_unique<RecordingByteStream>();
        stream->onRead = onRead;
        return stream;
    }
};

class FileCopying : public testing::Test
{
protected:
    FileCopying() { targetStore->folders.insert(provider::StorageIRI(u"t://h/d")); }

    /// The reason of the failure at the source; the target is empty then.
    std::string failure()
    {
        try {
            copier.copy(source, target, TargetState::Unknown, context);
            return "";
        } catch (Failure const& failure) {
            EXPECT_EQ(failure.location, "source");
            EXPECT_TRUE(targetStore->files.empty());
            return failure.reason;
        }
    }

    Progress progress;
    FileCopier const copier{progress, {}};
    WorkerContext context{std::vector<char>(16), {}};
    std::shared_ptr<Source> const sourceStore = std::make_shared<Source>();
    std::shared_ptr<MinimalProvider> const targetStore = std::make_shared<MinimalProvider>();
    Place const source{provider::StorageItem(sourceStore, provider::StorageIRI(u"s://h/f")), "source"};
    Place const target{provider::StorageItem(targetStore, provider::StorageIRI(u"t://h/d/f")), "target"};
};

TEST_F(FileCopying, GoesBetweenStoresAndOnAfterShortReads)
{
    sourceStore->onRead = foundation::tests::support::readsFrom("0123456789", 3);
    EXPECT_EQ(failure(), "");
    EXPECT_EQ(targetStore->content(target.item().getLocation()), "0123456789");
}

TEST_F(FileCopying, FailsWhenAReadMakesNoProgressOrTellsTooMuch)
{
    for (long const answer : {0L, 1L << 40U}) {
        sourceStore->onRead = [&](char*, long) { return answer; };
        EXPECT_EQ(failure(), "reading or writing failed");
    }
}

TEST_F(FileCopying, FailsAtTheSourceWhenAReadFailsInTheMiddle)
{
    int reads = 0;
    sourceStore->onRead = [&](char*, long) -> long {
        if (++reads == 2)
            throw provider::Exception(provider::ErrorCode::PermissionDenied, source.item().getLocation());
        return 1;
    };
    EXPECT_EQ(failure(), "permission denied");
}

} // namespace
