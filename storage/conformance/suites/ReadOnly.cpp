#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/conditions.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/conformance/detail/policies.hpp>
#include <storage/provider/Exception.hpp>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

Tree const content{{u"file", "content"}, {u"folder/", ""}, {u"folder/inner", "inner"}};

/// Of what exists and of what does not: the refusal comes before any look at the store.
constexpr std::array paths{u"file", u"folder", u"missing", u"missing/inner"};

void expectRefused(Harness const& harness, std::function<void(IProvider const&, StorageIRI const&)> const& change)
{
    Scene const scene(harness, content);
    for (auto const* const path : paths)
        EXPECT_TRUE(scene.refuses([&] { change(scene.provider(), scene.iri(path)); }, ErrorCode::ReadOnlyProvider,
                                  scene.iri(path)));
}

void creatingIsRefused(Harness const& harness)
{
    expectRefused(harness, [](auto& provider, auto& iri) { provider.createFile(iri); });
    expectRefused(harness, [](auto& provider, auto& iri) { provider.createFolder(iri); });
    expectRefused(harness, [](auto& provider, auto& iri) { provider.createFolderRecursive(iri); });
}

void removingIsRefused(Harness const& harness)
{
    expectRefused(harness, [](auto& provider, auto& iri) { provider.removeFile(iri); });
    expectRefused(harness, [](auto& provider, auto& iri) { provider.removeFolder(iri); });
    expectRefused(harness, [](auto& provider, auto& iri) { provider.removeFolderRecursively(iri); });
}

void openingForWritingIsRefused(Harness const& harness)
{
    for (auto const create : {ByteStreamCreate::Create, ByteStreamCreate::NeverCreate})
        for (auto const access : {ByteStreamAccess::WriteOnly, ByteStreamAccess::ReadWrite})
            for (auto const truncate : {ByteStreamTruncate::TruncateExisting, ByteStreamTruncate::PreserveExisting})
                expectRefused(harness, [&](auto& provider, auto& iri) {
                    provider.openStream(iri, {access, create, truncate, ByteStreamAppend::Append});
                });
}

void settingAttributesIsRefused(Harness const& harness)
{
    boost::posix_time::ptime const time(boost::gregorian::date(2020, 1, 2));
    expectRefused(harness, [&](auto& provider, auto& iri) { provider.setLastModified(iri, time); });
    expectRefused(harness, [](auto& provider, auto& iri) { provider.setWritable(iri, true); });
    expectRefused(harness, [](auto& provider, auto& iri) { provider.setWritable(iri, false); });
}

void movingAndCopyingNameTheSource(Harness const& harness)
{
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const target : {u"file", u"folder", u"new"}) {
            auto const to = [=](StorageIRI const& from) { return StorageIRI(from, target); };
            expectRefused(harness, [&](auto& provider, auto& from) { provider.moveFile(from, to(from), policy); });
            expectRefused(harness, [&](auto& provider, auto& from) { provider.copyFile(from, to(from), policy); });
            expectRefused(harness, [&](auto& provider, auto& from) {
                provider.moveFolder(from, StorageIRI(from.getParent(), target), policy);
            });
        }
}

/// It fails where the scratch file would have to stand, beside the target, or at the target itself.
void transactionsAreRefused(Harness const& harness)
{
    Scene const scene(harness, content);
    for (auto const* const path : {u"file", u"missing"}) {
        try {
            scene.provider().openTransactionalStream(scene.iri(path), {});
            ADD_FAILURE() << "opened for writing";
        } catch (Exception const& error) {
            EXPECT_EQ(error.getErrorCode(), ErrorCode::ReadOnlyProvider);
            EXPECT_EQ(error.getStorageIRI().getParent(), scene.iri());
        }
        EXPECT_TRUE(scene.holds(content));
    }
}

} // namespace

std::vector<Check> readOnlyChecks()
{
    return Family("ReadOnly")
        .when(disclaims(&Capabilities::writable),
              {
                  CHECK_FUNCTION(creatingIsRefused),
                  CHECK_FUNCTION(removingIsRefused),
                  CHECK_FUNCTION(openingForWritingIsRefused),
                  CHECK_FUNCTION(settingAttributesIsRefused),
                  CHECK_FUNCTION(movingAndCopyingNameTheSource),
                  CHECK_FUNCTION(transactionsAreRefused),
              })
        .checks();
}

} // namespace foundation::storage::conformance::detail
