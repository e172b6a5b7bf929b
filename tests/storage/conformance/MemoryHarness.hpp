#pragma once

#include <storage/conformance/Harness.hpp>
#include <storage/memory/MemoryProvider.hpp>

namespace foundation::storage::conformance {

/// Tries the provider of files in memory, in a store of its own.
inline Harness memoryHarness()
{
    auto const makePlace = [] {
        provider::StorageIRI const root(u"mem://conformance/");
        return Place{.provider = std::make_shared<memory::MemoryProvider>(root), .folder = root, .owner = {}};
    };
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

} // namespace foundation::storage::conformance
