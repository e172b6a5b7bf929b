#include <tests/storage/conformance/LocalHarness.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/LocalProvider.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <filesystem>
#include <sys/stat.h>

namespace foundation::storage::conformance {

namespace {

std::string native(provider::StorageIRI const& iri)
{
    return fl::filesystem::to_native_bytes(iri.getPath());
}

Place makePlace()
{
    auto const folder = std::make_shared<tests::support::TemporaryFolder>();
    return {std::make_shared<local::LocalProvider>(), folder->iri(), folder};
}

} // namespace

Harness localHarness()
{
    return {
        .makePlace = makePlace,
        .capabilities = {.copyOntoItself = CopyOntoItself::ChangesNothing, .longestName = 255},
        .makers = {
            .symbolicLink = [](auto& link,
                               auto& target) { std::filesystem::create_symlink(native(target), native(link)); },
            .secondName = [](auto& name, auto& file) { std::filesystem::create_hard_link(native(file), native(name)); },
            .specialFile = [](auto& path) { ::mkfifo(native(path).c_str(), 0600); }},
    };
}

} // namespace foundation::storage::conformance
