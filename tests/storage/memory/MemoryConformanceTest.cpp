#include <storage/memory/MemoryProvider.hpp>

#include <storage/conformance/registerConformance.hpp>

namespace foundation::storage::memory {
namespace {

using namespace conformance;

Place makePlace()
{
    provider::StorageIRI const root(u"mem://conformance/");
    return {.provider = std::make_shared<MemoryProvider>(root), .folder = root, .owner = {}};
}

Harness harness()
{
    return {.makePlace = makePlace,
            .capabilities = {.recursiveRemoval = true,
                             .recursiveListing = true,
                             .atomicCopy = true,
                             .copyOntoItself = CopyOntoItself::ChangesNothing,
                             .patterns = Patterns::Globs,
                             .settableTimes = boost::posix_time::microseconds(1),
                             .settableWritability = true,
                             .enforcedWritability = true,
                             .fileEvents = true,
                             .folderEvents = true}};
}

FOUNDATION_STORAGE_CONFORMANCE(Memory, harness());

} // namespace
} // namespace foundation::storage::memory
