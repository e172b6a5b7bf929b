// Copies from one provider to another: what they make, and what they refuse.

#include <storage/conformance/detail/CopyFamily.hpp>
#include <storage/conformance/detail/CopyScene.hpp>
#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/conformance/detail/hostileNames.hpp>
#include <storage/conformance/detail/policies.hpp>

#include <algorithm>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

void aFreeNameIsTakenUnderEveryPolicy(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, "content");
    for (CopyMode const mode : copyModes)
        for (ReplacementPolicy const policy : allPolicies) {
            SCOPED_TRACE(testing::Message() << mode << ", " << policy);
            scene.prepare({{u"other", "other"}});
            EXPECT_TRUE(copied(scene.from(), scene.to(), mode.options(policy)).is(TransactionStatus::Completed));
            EXPECT_TRUE(scene.isCopied());
        }
}

void filesOfEverySizeAreCopiedWhole(Harness const& source, Harness const& destination)
{
    for (std::size_t const size : {std::size_t{0}, std::size_t{1}, copyChunk - 1, copyChunk, copyChunk + 1}) {
        CopyScene scene(source, destination, someContent(size));
        for (CopyMode const mode : copyModes) {
            SCOPED_TRACE(testing::Message() << mode << ", " << size << " bytes");
            scene.prepare({{u"to", "old"}});
            EXPECT_TRUE(copied(scene.from(), scene.to(), mode.options()).is(TransactionStatus::Completed));
            EXPECT_TRUE(scene.isCopied());
        }
    }
}

void aPreservingPolicyKeepsTheDestination(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, "new");
    scene.prepare({{u"to", "old"}});
    StorageItem const missing = scene.source().item(u"missing");
    CopyFailure const failure{ErrorCode::ResourceAlreadyExists, scene.to().getLocation()};
    for (CopyMode const mode : copyModes)
        for (ReplacementPolicy const policy : preservingPolicies) {
            SCOPED_TRACE(testing::Message() << mode << ", " << policy);
            EXPECT_TRUE(copied(scene.from(), scene.to(), mode.options(policy)).is(failure));
            EXPECT_TRUE(copied(missing, scene.to(), mode.options(policy)).is(failure));
            EXPECT_TRUE(scene.isUntouched());
        }
}

void aReplacingPolicyReplacesTheDestination(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, "new");
    for (CopyMode const mode : copyModes)
        for (ReplacementPolicy const policy : replacingPolicies) {
            SCOPED_TRACE(testing::Message() << mode << ", " << policy);
            scene.prepare({{u"to", "old, and longer than the new content"}});
            EXPECT_TRUE(copied(scene.from(), scene.to(), mode.options(policy)).is(TransactionStatus::Completed));
            EXPECT_TRUE(scene.isCopied());
        }
}

void aFolderIsNeverReplaced(Harness const& source, Harness const& destination)
{
    Scene const from(source, {{u"from", "content"}});
    Scene const to(destination, {{u"empty/", ""}, {u"full/", ""}, {u"full/inner", "inner"}});
    for (CopyMode const mode : copyModes)
        for (ReplacementPolicy const policy : allPolicies)
            for (auto const* const folder : {u"empty", u"full"}) {
                SCOPED_TRACE(testing::Message() << mode << ", " << policy);
                EXPECT_TRUE(copied(from.item(u"from"), to.item(folder), mode.options(policy))
                                .is(CopyFailure{ErrorCode::ResourceAlreadyExists, to.iri(folder)}));
                EXPECT_TRUE(to.holds({{u"empty/", ""}, {u"full/", ""}, {u"full/inner", "inner"}}));
            }
}

void theSourceHasToBeAFile(Harness const& source, Harness const& destination)
{
    Scene const from(source, {{u"file", "content"}, {u"folder/", ""}});
    Scene const to(destination, {{u"to", "old"}});
    for (CopyMode const mode : copyModes)
        for (auto const* const path : {u"missing", u"missing/inner", u"file/inner", u"folder"})
            for (auto const* const target : {u"to", u"new"}) {
                SCOPED_TRACE(testing::Message() << mode);
                EXPECT_TRUE(copied(from.item(path), to.item(target), mode.options())
                                .is(CopyFailure{ErrorCode::ResourceNotFound, from.iri(path)}));
                EXPECT_TRUE(to.holds({{u"to", "old"}}));
            }
}

void theDestinationNeedsAFolderToStandIn(Harness const& source, Harness const& destination)
{
    Scene const from(source, {{u"from", "content"}});
    Scene const to(destination, {{u"file", "other"}});
    for (CopyMode const mode : copyModes)
        for (auto const* const path : {u"missing/to", u"file/to"}) {
            SCOPED_TRACE(testing::Message() << mode);
            EXPECT_TRUE(copied(from.item(u"from"), to.item(path), mode.options())
                            .is(CopyFailure{ErrorCode::ResourceNotFound, to.iri(path), mode.isAtomic()}));
            EXPECT_TRUE(to.holds({{u"file", "other"}}));
        }
}

std::vector<std::u16string> namesForBoth(Harness const& source, Harness const& destination)
{
    std::vector<std::u16string> const there = hostileNamesFor(destination.capabilities);
    std::vector<std::u16string> names = hostileNamesFor(source.capabilities);
    std::erase_if(names, [&](auto& name) { return std::find(there.begin(), there.end(), name) == there.end(); });
    return names;
}

void hostileNamesStayAsTheyAre(Harness const& source, Harness const& destination)
{
    Tree files;
    for (std::u16string const& name : namesForBoth(source, destination))
        files[name] = "content " + std::to_string(files.size());
    Scene const from(source, files);
    Scene const to(destination);
    for (auto const& [name, content] : files)
        for (CopyMode const mode : copyModes)
            EXPECT_TRUE(copied(from.item(name), to.item(name), mode.options()).is(TransactionStatus::Completed))
                << to.iri(name);
    EXPECT_TRUE(from.holds(files));
    EXPECT_TRUE(to.holds(files));
}

} // namespace

std::vector<Check> copyPolicyChecks(Harness const& source)
{
    return copyFamily("CopyPolicies", source,
                      {
                          COPY_CHECK_FUNCTION(aFreeNameIsTakenUnderEveryPolicy),
                          COPY_CHECK_FUNCTION(filesOfEverySizeAreCopiedWhole),
                          COPY_CHECK_FUNCTION(aPreservingPolicyKeepsTheDestination),
                          COPY_CHECK_FUNCTION(aReplacingPolicyReplacesTheDestination),
                          COPY_CHECK_FUNCTION(aFolderIsNeverReplaced),
                          COPY_CHECK_FUNCTION(theSourceHasToBeAFile),
                          COPY_CHECK_FUNCTION(theDestinationNeedsAFolderToStandIn),
                          COPY_CHECK_FUNCTION(hostileNamesStayAsTheyAre),
                      });
}

} // namespace foundation::storage::conformance::detail
