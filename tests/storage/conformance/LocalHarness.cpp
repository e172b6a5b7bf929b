#include <tests/storage/conformance/LocalHarness.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/LocalProvider.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <boost/property_tree/ptree.hpp>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <set>
#include <string>
#include <sys/stat.h>
#include <unistd.h>

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

Place makeConfinedPlace()
{
    auto const folder = std::make_shared<tests::support::TemporaryFolder>();
    auto const provider = std::make_shared<local::LocalProvider>();
    boost::property_tree::ptree settings;
    settings.put("root", folder->path().native());
    provider->configure(settings);
    return {provider, folder->iri(), folder};
}

/// Links that do not name the folder in which they work.
void makeRelativeLink(provider::StorageIRI const& link, provider::StorageIRI const& target)
{
    std::filesystem::path const path = native(link);
    std::filesystem::create_symlink(std::filesystem::path(native(target)).lexically_relative(path.parent_path()), path);
}

/// Not for root, unless it has given up what puts it above them.
bool permissionsBind()
{
    tests::support::TemporaryFolder const folder;
    std::filesystem::path const file = folder.path() / "nobody's";
    std::ofstream(file) << "secret";
    std::filesystem::permissions(file, std::filesystem::perms::none);
    return ::access(file.c_str(), R_OK) != 0;
}

std::set<std::string> attributesOfEveryFile()
{
    std::set<std::string> names{"mode",   "uid",       "gid",        "links",     "inode",
                                "device", "allocated", "accessTime", "changeTime"};
    struct statx status
    {};
    std::string const folder = std::filesystem::temp_directory_path();
    if (::statx(AT_FDCWD, folder.c_str(), 0, STATX_BTIME, &status) == 0 && (status.stx_mask & STATX_BTIME) != 0)
        names.insert("birthTime");
    return names;
}

} // namespace

Harness localHarness()
{
    return {
        .makePlace = makePlace,
        .capabilities = {.recursiveRemoval = true,
                         .recursiveListing = true,
                         .atomicCopy = true,
                         .copyOntoItself = CopyOntoItself::ChangesNothing,
                         .patterns = Patterns::Globs,
                         .settableTimes = boost::posix_time::microseconds(1),
                         .settableWritability = true,
                         .enforcedWritability = permissionsBind(),
                         .fileEvents = true,
                         .folderEvents = true,
                         .extendedAttributes = attributesOfEveryFile(),
                         .longestName = 255},
        .makers = {
            .symbolicLink = [](auto& link,
                               auto& target) { std::filesystem::create_symlink(native(target), native(link)); },
            .secondName = [](auto& name, auto& file) { std::filesystem::create_hard_link(native(file), native(name)); },
            .specialFile = [](auto& path) { ::mkfifo(native(path).c_str(), 0600); }},
    };
}

Harness confinedLocalHarness()
{
    Harness harness = localHarness();
    harness.makePlace = makeConfinedPlace;
    harness.capabilities.servesTop = false;
    harness.makers.symbolicLink = makeRelativeLink;
    return harness;
}

} // namespace foundation::storage::conformance
