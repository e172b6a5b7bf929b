// Copies from one provider to another in sixteen threads.

#include <storage/conformance/detail/CopyFamily.hpp>
#include <storage/conformance/detail/CopyScene.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/conformance/detail/threads.hpp>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

constexpr int rounds = 5;

std::u16string ownName(int thread)
{
    return u"of thread " + std::u16string(1, static_cast<char16_t>(u'a' + thread));
}

Tree ownFiles()
{
    Tree files;
    for (int thread = 0; thread < threadCount; ++thread)
        files[ownName(thread)] = std::string(20000 + static_cast<std::size_t>(thread), static_cast<char>('a' + thread));
    return files;
}

void copiesDoNotDisturbEachOther(Harness const& source, Harness const& destination)
{
    Tree const files = ownFiles();
    Scene const from(source, files);
    Scene const to(destination);
    onThreads([&](int thread) {
        for (int round = 0; round < rounds; ++round)
            for (CopyMode const mode : copyModes)
                from.item(ownName(thread)).copyFile(to.item(ownName(thread)), mode.options());
    });
    EXPECT_TRUE(from.holds(files));
    EXPECT_TRUE(to.holds(files));
}

void atomicCopiesOntoOneFileDoNotMix(Harness const& source, Harness const& destination)
{
    Tree const files = ownFiles();
    Scene const from(source, files);
    Scene const to(destination, {{u"to", files.begin()->second}});
    onThreads([&](int thread) {
        for (int round = 0; round < rounds; ++round) {
            from.item(ownName(thread)).copyFile(to.item(u"to"), CopyMode{TransactionPolicy::Atomic, true}.options());
            std::string const content = to.read(u"to");
            requireThat(!content.empty() && content == files.at(ownName(content.front() - 'a')), "content is whole");
        }
    });
    EXPECT_EQ(to.tree().size(), 1u);
}

} // namespace

std::vector<Check> copyConcurrencyChecks(Harness const& source)
{
    if (!source.capabilities.concurrentUse)
        return {};
    std::vector<Check> checks = copyFamily("CopyConcurrency", source,
                                           {
                                               COPY_CHECK_FUNCTION(copiesDoNotDisturbEachOther),
                                               COPY_CHECK_FUNCTION(atomicCopiesOntoOneFileDoNotMix),
                                           });
    for (Check& check : checks)
        check.applies = [](Harness const& destination) {
            return destination.capabilities.writable && destination.capabilities.concurrentUse;
        };
    return checks;
}

} // namespace foundation::storage::conformance::detail
