// What does it cost to ask a factory for a provider that lives, beside a map of texts under a lock?

#include <storage/memory/MemoryProvider.hpp>
#include <storage/memory/MemoryProviderFactory.hpp>
#include <storage/provider/PhysicalProviderFactory.hpp>

#include <benchmark/benchmark.h>

#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace {

using namespace foundation::storage::provider;
using foundation::storage::memory::MemoryProvider;
using foundation::storage::memory::MemoryProviderFactory;

constexpr std::int64_t callCount = 1'000'000;

/// So many providers live at once.
constexpr std::size_t storeCount = 16;

/// Pays for nothing but the cache: its keys are the locations it is given.
class LocationFactory final : public PhysicalProviderFactory
{
protected:
    std::shared_ptr<IProvider> doBuildProvider(StorageIRI const& location) const override
    {
        return std::make_shared<MemoryProvider>(location);
    }
    StorageIRI doGetKey(StorageIRI const& location) const override { return location; }
};

std::vector<StorageIRI> locations()
{
    std::vector<StorageIRI> made;
    for (std::size_t i = 0; i != storeCount; ++i)
        made.emplace_back(u"mem://store-" + std::u16string(1, static_cast<char16_t>(u'a' + i)) + u"/reports/2024.txt");
    return made;
}

template <typename Find>
void findEach(benchmark::State& state, Find const& find)
{
    for (auto _ : state) {
        for (std::int64_t call = 0; call != callCount; ++call)
            benchmark::DoNotOptimize(find(static_cast<std::size_t>(call) % storeCount));
    }
    state.SetItemsProcessed(state.iterations() * callCount);
}

void findWith(benchmark::State& state, PhysicalProviderFactory const& factory)
{
    auto const asked = locations();
    std::vector<std::shared_ptr<IProvider>> held;
    for (StorageIRI const& location : asked)
        held.push_back(factory.buildProvider(location));
    findEach(state, [&](std::size_t i) {
        auto provider = factory.buildProvider(asked[i]);
        if (provider != held[i])
            state.SkipWithError("another provider was found");
        return provider;
    });
}

void find_provider_MemoryProviderFactory(benchmark::State& state)
{
    findWith(state, MemoryProviderFactory());
}
BENCHMARK(find_provider_MemoryProviderFactory)->Unit(benchmark::kMillisecond);

void find_provider_LocationFactory(benchmark::State& state)
{
    findWith(state, LocationFactory());
}
BENCHMARK(find_provider_LocationFactory)->Unit(benchmark::kMillisecond);

void find_provider_map(benchmark::State& state)
{
    std::mutex mutex;
    std::map<std::u16string, std::weak_ptr<IProvider>> cache;
    std::vector<std::u16string> texts;
    std::vector<std::shared_ptr<IProvider>> held;
    for (StorageIRI const& location : locations()) {
        texts.push_back(location.toString());
        held.push_back(std::make_shared<MemoryProvider>(location));
        cache.emplace(texts.back(), held.back());
    }
    findEach(state, [&](std::size_t i) {
        std::lock_guard const lock(mutex);
        return cache.find(texts[i])->second.lock();
    });
}
BENCHMARK(find_provider_map)->Unit(benchmark::kMillisecond);

} // namespace

BENCHMARK_MAIN();
