#include <storage/conformance/registerConformance.hpp>
#include <storage/local/LocalProvider.hpp>

#include <cerrno>
#include <filesystem>
#include <memory>
#include <stdlib.h>
#include <string>
#include <system_error>

using namespace foundation::storage;

conformance::Place makePlace()
{
    std::string path = std::filesystem::temp_directory_path() / "conformance-XXXXXX";
    if (::mkdtemp(path.data()) == nullptr)
        throw std::system_error(errno, std::generic_category(), path);
    auto const remove = [path](void*) { std::filesystem::remove_all(path); };
    return {.provider = std::make_shared<local::LocalProvider>(),
            .folder = provider::StorageIRI(u"file://" + std::u16string(path.begin(), path.end())),
            .owner = std::shared_ptr<void>(nullptr, remove)};
}

conformance::Harness harness()
{
    return {.makePlace = makePlace,
            .capabilities = {.copyOntoItself = conformance::CopyOntoItself::ChangesNothing, .longestName = 255}};
}

FOUNDATION_STORAGE_CONFORMANCE(Local, harness());
