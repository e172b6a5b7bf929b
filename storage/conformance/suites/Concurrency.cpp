#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/conformance/detail/listings.hpp>
#include <storage/conformance/detail/threads.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/StreamClosePolicy.hpp>

#include <algorithm>
#include <atomic>
#include <functional>
#include <thread>
#include <vector>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

constexpr int rounds = 20;

std::u16string ownName(int thread)
{
    return u"of thread " + std::u16string(1, static_cast<char16_t>(u'a' + thread));
}

/// Content by which a mixture of two writers is told from what one of them wrote.
std::string ownContent(int thread)
{
    return std::string(20000 + static_cast<std::size_t>(thread) * 1000, static_cast<char>('a' + thread));
}

bool isSomeonesContent(std::string const& content)
{
    return !content.empty() && content == ownContent(content.front() - 'a');
}

/// What it threw; `ErrorCode::Unknown` for success.
ErrorCode outcome(std::function<void()> const& action)
{
    try {
        action();
        return ErrorCode::Unknown;
    } catch (Exception const& error) {
        return error.getErrorCode();
    }
}

/// All threads at once do what one of them alone can succeed in; the others fail with `code`.
void expectOneWinner(ErrorCode code, std::function<void(int thread)> const& action)
{
    std::vector<ErrorCode> outcomes(threadCount);
    onThreads([&](int thread) { outcomes[static_cast<std::size_t>(thread)] = outcome([&] { action(thread); }); });
    EXPECT_EQ(std::count(outcomes.begin(), outcomes.end(), ErrorCode::Unknown), 1);
    EXPECT_EQ(std::count(outcomes.begin(), outcomes.end(), code), threadCount - 1);
}

void threadsDoNotDisturbEachOther(Harness const& harness)
{
    Scene const scene(harness);
    onThreads([&](int thread) {
        StorageItem const folder = scene.item(ownName(thread));
        for (int round = 0; round < rounds; ++round) {
            folder.createFolder();
            StorageItem const file(folder, u"file");
            StorageItem const moved(folder, u"moved");
            writeFile(file, ownContent(thread));
            requireThat(readFile(file) == ownContent(thread), "what was written is read");
            requireThat(file.getFileAttributes().getSize() == ownContent(thread).size(), "the size is right");
            file.moveFile(moved.getLocation(), ReplacementPolicy::Preserve);
            requireThat(namesOf(folder.listAll()) == Names{u"moved"}, "one file is listed");
            moved.removeFile();
            folder.removeFolder();
        }
    });
    EXPECT_TRUE(scene.holds({}));
}

void oneThreadCreatesAName(Harness const& harness)
{
    for (int round = 0; round < rounds; ++round) {
        Scene const scene(harness);
        expectOneWinner(ErrorCode::ResourceAlreadyExists,
                        [&](int) { scene.provider().createFile(scene.iri(u"file")); });
        expectOneWinner(ErrorCode::ResourceAlreadyExists,
                        [&](int) { scene.provider().createFolder(scene.iri(u"folder")); });
        EXPECT_TRUE(scene.holds({{u"file", ""}, {u"folder/", ""}}));
    }
}

void oneThreadRemovesAName(Harness const& harness)
{
    for (int round = 0; round < rounds; ++round) {
        Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
        expectOneWinner(ErrorCode::ResourceNotFound, [&](int) { scene.provider().removeFile(scene.iri(u"file")); });
        expectOneWinner(ErrorCode::ResourceNotFound, [&](int) { scene.provider().removeFolder(scene.iri(u"folder")); });
        EXPECT_TRUE(scene.holds({}));
    }
}

void oneThreadMovesToAName(Harness const& harness)
{
    Tree sources;
    for (int thread = 0; thread < threadCount; ++thread)
        sources[ownName(thread)] = ownContent(thread);
    for (int round = 0; round < rounds; ++round) {
        Scene const scene(harness, sources);
        auto const policy = round % 2 == 0 ? ReplacementPolicy::Preserve : ReplacementPolicy::NoClobber;
        expectOneWinner(ErrorCode::ResourceAlreadyExists, [&](int thread) {
            scene.provider().moveFile(scene.iri(ownName(thread)), scene.iri(u"target"), policy);
        });
        EXPECT_TRUE(isSomeonesContent(scene.read(u"target")));
        EXPECT_EQ(scene.tree().size(), sources.size());
    }
}

void foldersWithTheirAncestorsAreMadeTogether(Harness const& harness)
{
    for (int round = 0; round < rounds; ++round) {
        Scene const scene(harness);
        onThreads([&](int) {
            ErrorCode const code = outcome([&] { scene.provider().createFolderRecursive(scene.iri(u"a/b/c")); });
            requireThat(code == ErrorCode::Unknown || code == ErrorCode::ResourceAlreadyExists,
                        "another thread may have made it");
        });
        EXPECT_TRUE(scene.holds({{u"a/", ""}, {u"a/b/", ""}, {u"a/b/c/", ""}}));
    }
}

/// Every fourth thread does its rounds of `change`; meanwhile all others look, for as long as anything changes.
void whileSomeChange(std::function<void(int thread, int round)> const& change, std::function<void()> const& look)
{
    std::atomic<int> changing = threadCount / 4;
    onThreads([&](int thread) {
        if (thread % 4 != 0) {
            do {
                look();
                std::this_thread::yield();
            } while (changing > 0);
            return;
        }
        struct Leaving
        {
            ~Leaving() { --count; }
            std::atomic<int>& count;
        } const leaving{changing};
        for (int round = 0; round < rounds; ++round)
            change(thread, round);
    });
}

void readersSeeOneCommitOrAnother(Harness const& harness)
{
    Scene const scene(harness, {{u"file", ownContent(0)}});
    whileSomeChange(
        [&](int thread, int round) {
            auto const transaction = scene.provider().openTransactionalStream(scene.iri(u"file"), {});
            writeAll(*transaction->byteStream(), ownContent(thread));
            transaction->close(round % 4 == 3 ? StreamClosePolicy::Abort : StreamClosePolicy::Commit);
        },
        [&] { requireThat(isSomeonesContent(scene.read(u"file")), "content is whole"); });
    EXPECT_TRUE(isSomeonesContent(scene.read(u"file")));
    EXPECT_EQ(scene.tree().size(), 1u);
}

void theFileIsNeverMissingWhileItIsReplaced(Harness const& harness)
{
    Scene const scene(harness, {{u"file", ownContent(0)}});
    whileSomeChange(
        [&](int thread, int) {
            scene.write(ownName(thread), ownContent(thread));
            scene.provider().moveFile(scene.iri(ownName(thread)), scene.iri(u"file"), ReplacementPolicy::Overwrite);
        },
        [&] { requireThat(scene.provider().fileExists(scene.iri(u"file")), "the file is there"); });
    EXPECT_TRUE(isSomeonesContent(scene.read(u"file")));
    EXPECT_EQ(scene.tree().size(), 1u);
}

void listingsGoOnWhileTheFolderChanges(Harness const& harness)
{
    Scene const scene(harness, {{u"always", "content"}});
    whileSomeChange(
        [&](int thread, int) {
            scene.write(ownName(thread), "content");
            scene.provider().removeFile(scene.iri(ownName(thread)));
        },
        [&] {
            Names const names = namesOf(scene.provider().listAll(scene.iri()));
            requireThat(std::count(names.begin(), names.end(), u"always") == 1, "what stays is listed once");
        });
    EXPECT_TRUE(scene.holds({{u"always", "content"}}));
}

void appendedBlocksAreNotTornOrLost(Harness const& harness)
{
    constexpr ByteStreamOpenOptions append{ByteStreamAccess::WriteOnly, ByteStreamCreate::NeverCreate,
                                           ByteStreamTruncate::PreserveExisting, ByteStreamAppend::Append};
    Scene const scene(harness, {{u"file", ""}});
    onThreads([&](int thread) {
        auto const stream = scene.provider().openStream(scene.iri(u"file"), append);
        for (int round = 0; round < rounds; ++round)
            requireThat(stream->write(std::string(100, static_cast<char>('a' + thread)).data(), 100) == 100,
                        "a block is taken whole");
        stream->close();
    });
    std::string const content = scene.read(u"file");
    ASSERT_EQ(content.size(), static_cast<std::size_t>(threadCount) * rounds * 100);
    for (std::size_t block = 0; block < content.size(); block += 100)
        EXPECT_EQ(content.substr(block, 100), std::string(100, content[block]));
}

bool servesThreads(Harness const& harness)
{
    return harness.capabilities.concurrentUse;
}

void threadsReadOneFile(Harness const& harness)
{
    std::string const content = someContent(300000);
    Scene const scene(harness, {{u"file", content}});
    onThreads([&](int) {
        for (int round = 0; round < rounds; ++round) {
            requireThat(scene.read(u"file") == content, "content is whole");
            requireThat(namesOf(scene.provider().listAll(scene.iri())) == Names{u"file"}, "the file is listed");
            requireThat(scene.provider().getFileAttributes(scene.iri(u"file")).getSize() == content.size(),
                        "the size is right");
        }
    });
}

void copiesDoNotMix(Harness const& harness)
{
    Tree sources;
    for (int thread = 0; thread < threadCount; ++thread)
        sources[ownName(thread)] = ownContent(thread);
    Scene const scene(harness, sources);
    onThreads([&](int thread) {
        std::u16string const copy = u"copy " + ownName(thread);
        for (int round = 0; round < rounds; ++round)
            scene.provider().copyFile(scene.iri(ownName(thread)), scene.iri(copy), ReplacementPolicy::Overwrite);
        requireThat(scene.read(copy) == ownContent(thread), "the copy is whole");
    });
    EXPECT_EQ(scene.tree().size(), 2 * sources.size());
}

void readersSeeOneAtomicCopyOrAnother(Harness const& harness)
{
    Tree sources{{u"file", ownContent(0)}};
    for (int thread = 0; thread < threadCount; ++thread)
        sources[ownName(thread)] = ownContent(thread);
    Scene const scene(harness, sources);
    whileSomeChange(
        [&](int thread, int) {
            scene.provider().copyFileAtomic(scene.iri(ownName(thread)), scene.iri(u"file"),
                                            ReplacementPolicy::Overwrite, {});
        },
        [&] { requireThat(isSomeonesContent(scene.read(u"file")), "content is whole"); });
    EXPECT_EQ(scene.tree().size(), sources.size());
}

bool copiesAtomicallyForThreads(Harness const& harness)
{
    return harness.capabilities.atomicCopy && servesThreads(harness);
}

} // namespace

std::vector<Check> concurrencyChecks()
{
    return Family("Concurrency")
        .when(servesThreads, {CHECK_FUNCTION(threadsReadOneFile)})
        .forWritable(servesThreads,
                     {
                         CHECK_FUNCTION(threadsDoNotDisturbEachOther),
                         CHECK_FUNCTION(oneThreadCreatesAName),
                         CHECK_FUNCTION(oneThreadRemovesAName),
                         CHECK_FUNCTION(oneThreadMovesToAName),
                         CHECK_FUNCTION(foldersWithTheirAncestorsAreMadeTogether),
                         CHECK_FUNCTION(readersSeeOneCommitOrAnother),
                         CHECK_FUNCTION(theFileIsNeverMissingWhileItIsReplaced),
                         CHECK_FUNCTION(listingsGoOnWhileTheFolderChanges),
                         CHECK_FUNCTION(appendedBlocksAreNotTornOrLost),
                         CHECK_FUNCTION(copiesDoNotMix),
                     })
        .forWritable(copiesAtomicallyForThreads, {CHECK_FUNCTION(readersSeeOneAtomicCopyOrAnother)})
        .checks();
}

} // namespace foundation::storage::conformance::detail
