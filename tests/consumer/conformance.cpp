#include <storage/conformance/registerConformance.hpp>
#include <storage/memory/MemoryProvider.hpp>

#include <memory>

using namespace foundation::storage;

conformance::Place makePlace()
{
    provider::StorageIRI const root(u"mem://conformance/");
    return {.provider = std::make_shared<memory::MemoryProvider>(root), .folder = root, .owner = {}};
}

conformance::Harness harness()
{
    return {.makePlace = makePlace,
            .capabilities = {.recursiveRemoval = true,
                             .recursiveListing = true,
                             .atomicCopy = true,
                             .copyOntoItself = conformance::CopyOntoItself::ChangesNothing,
                             .patterns = conformance::Patterns::Globs,
                             .settableTimes = boost::posix_time::microseconds(1),
                             .settableWritability = true,
                             .enforcedWritability = true,
                             .fileEvents = true,
                             .folderEvents = true}};
}

FOUNDATION_STORAGE_CONFORMANCE(Memory, harness());
