#include <storage/archive/ArchiveProvider.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/conformance/registerConformance.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/zips.hpp>

#include <memory>

namespace foundation::storage::conformance {

namespace {

/// Every other file stored as it is, so that both ways of reading are tried.
std::vector<archive::ZipMember> membersOf(Tree const& content)
{
    std::vector<archive::ZipMember> members;
    for (auto const& [path, bytes] : content)
        members.push_back(
            {.name = fl::filesystem::to_native_bytes(path), .content = bytes, .isStored = members.size() % 2 == 1});
    return members;
}

Place makeFilledPlace(Tree const& content)
{
    provider::StorageItem const container = archive::makeFile(archive::makeZip(membersOf(content)));
    return {.provider = std::make_shared<archive::ArchiveProvider>(archive::ArchiveFormat::Zip, container),
            .folder = provider::StorageIRI(u"zip", container.getLocation(), u"/")};
}

Harness harness()
{
    return {.capabilities = {.writable = false,
                             .recursiveListing = true,
                             .patterns = Patterns::Globs,
                             .extendedAttributes = {"archive.access"}},
            .makeFilledPlace = makeFilledPlace};
}

} // namespace

FOUNDATION_STORAGE_CONFORMANCE(Zip, harness());

} // namespace foundation::storage::conformance
