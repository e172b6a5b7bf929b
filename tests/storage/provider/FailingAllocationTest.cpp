// What is left when memory runs out, at the first, second, third … allocation of an operation.

#include <storage/provider.hpp>

#include <storage/provider/detail/Lazy.hpp>
#include <tests/support/ConfigurableProvider.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/allocations.hpp>
#include <tests/support/locationWithText.hpp>

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;

StorageIRI const here(u"scheme://host.example/a-folder-with-a-long-name/a-file-with-a-long-name.txt");

template <class Action>
std::size_t failEachAllocationOf(Action action)
{
    return tests::support::failEachAllocationOf(action, [] {});
}

TEST(FailingAllocation, DestroysTheStreamThatADeviceCannotShare)
{
    int destroyed = 0;
    int made = 0;
    std::unique_ptr<ByteStream> stream;
    auto const makeStream = [&] {
        auto recording = std::make_unique<RecordingByteStream>();
        recording->onDestruction = [&destroyed] { ++destroyed; };
        stream = std::move(recording);
        ++made;
    };
    makeStream();
    std::size_t const failures = tests::support::failEachAllocationOf([&] { ByteStreamDevice const device(stream); },
                                                                      [&] {
                                                                          EXPECT_EQ(stream, nullptr);
                                                                          EXPECT_EQ(destroyed, made);
                                                                          makeStream();
                                                                      });
    EXPECT_GT(failures, 0u);
    EXPECT_EQ(destroyed, made) << "the device that could be made has gone too";
}

TEST(FailingAllocation, LeavesNoHalfMadeException)
{
    auto const text = std::make_shared<TextOnlyImpl>(u"a/b");
    StorageIRI const location(text);
    long const owners = text.use_count();
    auto const nobodyElseHoldsTheLocation = [&] { EXPECT_EQ(text.use_count(), owners); };
    auto const makeException = [&] {
        Exception const exception(ErrorCode::IOError, location);
        EXPECT_EQ(exception.getErrorCode(), ErrorCode::IOError);
    };
    auto const makeChangeEventException = [&] { ChangeEventsNotSupportedException const exception(location); };
    EXPECT_GT(tests::support::failEachAllocationOf(makeException, nobodyElseHoldsTheLocation), 1u);
    EXPECT_GT(tests::support::failEachAllocationOf(makeChangeEventException, nobodyElseHoldsTheLocation), 0u);
    nobodyElseHoldsTheLocation();
}

TEST(FailingAllocation, LeavesTheExceptionWhoseTextCannotBeMadeAsItWas)
{
    Exception const exception(ErrorCode::IOError, here);
    std::u16string const text = exception.ToUstringImpl();
    std::size_t const failures =
        tests::support::failEachAllocationOf([&] { EXPECT_FALSE(exception.ToUstringImpl().empty()); },
                                             [&] {
                                                 EXPECT_EQ(exception.getErrorCode(), ErrorCode::IOError);
                                                 EXPECT_EQ(exception.ToUstringImpl(), text);
                                             });
    EXPECT_GT(failures, 0u);
}

TEST(FailingAllocation, LeavesTheExceptionThatCannotBeClonedAsItWas)
{
    Exception const exception(ErrorCode::IOError, here);
    EXPECT_GT(failEachAllocationOf([&] { std::unique_ptr<core::except::IException> const copy(exception.clone()); }),
              0u);
    EXPECT_EQ(exception.getStorageIRI(), here);
}

/// Each makes a location of another kind; those that are made from another one find in it what they need.
std::vector<std::function<StorageIRI()>> makers()
{
    StorageIRI const container(u"scheme://host.example/a-container.zip");
    static_cast<void>(container.getParent());
    return {[] { return StorageIRI(u"scheme://host.example/a-folder/./with-a-long-name/"); },
            [] { return StorageIRI(u"zip:scheme://host.example/a-container.zip!/a%20folder/with-a-long-name"); },
            [] { return StorageIRI(u"a-scheme", fl::filesystem::upath(u"/a folder/with-a-long-name")); },
            [container] { return StorageIRI(u"zip", container, u"/a folder/with-a-long-name"); },
            [container] { return StorageIRI(container, u"a child with a long name"); }};
}

TEST(FailingAllocation, LeavesNothingOfALocationThatCannotBeMade)
{
    for (auto const& make : makers()) {
        std::ptrdiff_t const before = livingAllocations();
        EXPECT_GT(tests::support::failEachAllocationOf([&make] { make(); },
                                                       [before] { EXPECT_EQ(livingAllocations(), before); }),
                  1u);
    }
}

TEST(FailingAllocation, LeavesALocationToBeAskedAgain)
{
    for (auto const& make : makers()) {
        StorageIRI const expected = make();
        StorageIRI const location = make();
        std::size_t const failures = failEachAllocationOf([&] {
            EXPECT_EQ(location.getParent().toString(), expected.getParent().toString());
            EXPECT_EQ(location.getName(), expected.getName());
            EXPECT_EQ(location.getPath(), expected.getPath());
            EXPECT_EQ(location.getResolvedPath(), expected.getResolvedPath());
            EXPECT_EQ(location.hashValue(), expected.hashValue());
            EXPECT_EQ(location.toString(), expected.toString());
        });
        EXPECT_GT(failures, 3u) << expected;
    }
}

TEST(FailingAllocation, LeavesADeferredFlagToBeAskedAgain)
{
    int calls = 0;
    std::unique_ptr<int> made;
    detail::Lazy<bool> flag(detail::Lazy<bool>::Value(std::function<bool()>([&] {
        ++calls;
        made = std::make_unique<int>(1);
        return true;
    })));
    std::size_t const failures = failEachAllocationOf([&flag] { EXPECT_TRUE(flag()); });
    EXPECT_GT(failures, 0u);
    EXPECT_EQ(calls, static_cast<int>(failures) + 1);
}

TEST(FailingAllocation, DuringACopyLeavesTheSource)
{
    MinimalProvider store;
    StorageIRI const target(here.getParent(), u"another-file-with-a-long-name.txt");
    store.folders = {here.getParent()};
    store.put(here, "content");
    std::size_t const failures =
        tests::support::failEachAllocationOf([&] { store.copyFile(here, target, ReplacementPolicy::Overwrite); },
                                             [&] { EXPECT_EQ(store.content(here), "content"); });
    EXPECT_GT(failures, 0u);
    EXPECT_EQ(store.content(target), "content");
}

TEST(FailingAllocation, DuringAnAtomicCopyBetweenItemsLeavesTheTarget)
{
    auto const first = std::make_shared<MinimalProvider>();
    auto const second = std::make_shared<MinimalProvider>();
    first->put(here, "new");
    second->folders = {here.getParent()};
    second->put(here, "old");
    CopyFileOptions const options{ReplacementPolicy::Overwrite, TransactionPolicy::Atomic, {}};
    std::size_t const failures = tests::support::failEachAllocationOf(
        [&] { StorageItem(first, here).copyFile(StorageItem(second, here), options); },
        [&] { EXPECT_EQ(second->content(here), "old"); });
    EXPECT_GT(failures, 0u);
    EXPECT_EQ(second->content(here), "new");
}

/// Keeps sight of what it built.
class WatchingFactory : public PhysicalProviderFactory
{
public:
    mutable std::weak_ptr<IProvider> last;

protected:
    std::shared_ptr<IProvider> doBuildProvider(StorageIRI const&) const override
    {
        auto provider = std::make_shared<ConfigurableProvider>();
        last = provider;
        return provider;
    }
    StorageIRI doGetKey(StorageIRI const& location) const override { return location; }
};

TEST(FailingAllocation, WhileAProviderIsBuiltKeepsNothingOfIt)
{
    WatchingFactory factory;
    boost::property_tree::ptree tree;
    tree.put("a key with a long name", "a value that is long");
    factory.configure(tree);
    std::shared_ptr<IProvider> provider;
    std::size_t const failures = tests::support::failEachAllocationOf([&] { provider = factory.buildProvider(here); },
                                                                      [&] { EXPECT_TRUE(factory.last.expired()); });
    EXPECT_GT(failures, 1u);
    EXPECT_EQ(factory.buildProvider(here), provider);
}

TEST(FailingAllocation, DuringAnAbortedWriteLeavesTheTarget)
{
    MinimalProvider store;
    store.folders = {here.getParent()};
    store.put(here, "old");
    std::size_t const failures = tests::support::failEachAllocationOf(
        [&] {
            auto const stream = store.openTransactionalStream(here, {});
            stream->write("new", 3);
        },
        [&] { EXPECT_EQ(store.content(here), "old"); });
    EXPECT_GT(failures, 0u);
    EXPECT_EQ(store.content(here), "old");
}

} // namespace
} // namespace foundation::storage::provider
