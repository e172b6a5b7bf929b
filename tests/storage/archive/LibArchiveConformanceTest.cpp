#include <storage/archive/ArchiveProvider.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/conformance/registerConformance.hpp>
#include <tests/storage/archive/archives.hpp>
#include <tests/storage/archive/containers.hpp>

#include <memory>
#include <optional>
#include <string>

namespace foundation::storage::conformance {

namespace {

using archive::ArchiveFormat;

/// How libarchive makes the archives that are tried.
struct Recipe
{
    ArchiveFormat format;
    char const* scheme;
    char const* writer;
    char const* compression = "";
};

Place makeFilledPlace(Recipe const& recipe, Tree const& content)
{
    std::vector<archive::Member> members;
    for (auto const& [path, bytes] : content)
        members.push_back({.name = fl::filesystem::to_native_bytes(path), .content = bytes});
    provider::StorageItem const container =
        archive::makeFile(archive::makeArchive(recipe.writer, recipe.compression, members));
    std::string const scheme = recipe.scheme;
    return {.provider = std::make_shared<archive::ArchiveProvider>(recipe.format, container),
            .folder =
                provider::StorageIRI(std::u16string(scheme.begin(), scheme.end()), container.getLocation(), u"/")};
}

/// libarchive composes accents in the names of a 7z, which are in UTF-16, and writes images with names as on discs.
Harness harness(Recipe const& recipe)
{
    return {.capabilities = {.writable = false,
                             .recursiveListing = true,
                             .patterns = Patterns::Globs,
                             .extendedAttributes = {"archive.access"},
                             .normalisationSensitive = recipe.format != ArchiveFormat::SevenZip,
                             .longestName =
                                 recipe.format == ArchiveFormat::Iso ? std::optional<std::size_t>(255) : std::nullopt},
            .makeFilledPlace = [recipe](Tree const& content) { return makeFilledPlace(recipe, content); }};
}

} // namespace

FOUNDATION_STORAGE_CONFORMANCE(Tar, harness({ArchiveFormat::Tar, "tar", "pax"}));
FOUNDATION_STORAGE_CONFORMANCE(TarGzip, harness({ArchiveFormat::Tar, "tar", "pax", "gzip"}));
FOUNDATION_STORAGE_CONFORMANCE(SevenZip, harness({ArchiveFormat::SevenZip, "sevenzip", "7zip"}));
FOUNDATION_STORAGE_CONFORMANCE(Iso, harness({ArchiveFormat::Iso, "iso", "iso9660"}));
FOUNDATION_STORAGE_CONFORMANCE(Cpio, harness({ArchiveFormat::Cpio, "cpio", "newc"}));

} // namespace foundation::storage::conformance
