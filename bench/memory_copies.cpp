// What does it cost to copy 1 GiB from item to item where both are in memory, beside `memcpy`?

#include <storage/memory/MemoryProvider.hpp>
#include <storage/provider/StorageItem.hpp>

#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <ios>
#include <memory>
#include <span>
#include <vector>

namespace {

using namespace foundation::storage::provider;
using foundation::storage::memory::MemoryProvider;

constexpr std::size_t mebibyte = std::size_t{1} << 20;
constexpr std::size_t mebibytes = 1024;
constexpr std::size_t size = mebibytes * mebibyte;

/// Memory that the system has handed out for good, so that nobody pays for that while the clock runs.
std::vector<char>& source()
{
    static std::vector<char> region(size, 'x');
    return region;
}

std::vector<char>& target()
{
    static std::vector<char> region(size, 'y');
    return region;
}

/// The least that a stream can cost: the bytes lie ready.
class RegionStream final : public ByteStream
{
public:
    explicit RegionStream(std::span<char> region) : left_(region) {}

protected:
    long doRead(char* buffer, long count) override
    {
        std::size_t const moved = take(count);
        std::memcpy(buffer, left_.data() - moved, moved);
        return moved == 0 ? -1 : static_cast<long>(moved);
    }

    long doWrite(char const* data, long count) override
    {
        std::size_t const moved = take(count);
        std::memcpy(left_.data() - moved, data, moved);
        return static_cast<long>(moved);
    }

    long doSeek(long /*offset*/, std::ios_base::seekdir /*direction*/) override { return 0; }
    void doClose() override {}

private:
    std::size_t take(long count)
    {
        std::size_t const taken = std::min(static_cast<std::size_t>(count), left_.size());
        left_ = left_.subspan(taken);
        return taken;
    }

    std::span<char> left_;
};

/// Reads `source` and writes `target`, whatever the location.
class RegionProvider final : public MemoryProvider
{
public:
    using MemoryProvider::MemoryProvider;

protected:
    std::unique_ptr<ByteStream> doOpenStream(StorageIRI const&, ByteStreamOpenOptions const&) const override
    {
        return std::make_unique<RegionStream>(target());
    }

    std::unique_ptr<ByteStream> doOpenReadOnlyStream(StorageIRI const&) const override
    {
        return std::make_unique<RegionStream>(source());
    }
};

template <typename Provider>
StorageItem makeItem()
{
    StorageIRI const location(u"mem://bench/file");
    return StorageItem(std::make_shared<Provider>(location), location);
}

/// Runs `copy`, and reports the time of a mebibyte.
template <typename Copy>
void copyEach(benchmark::State& state, Copy const& copy)
{
    for (auto _ : state) {
        copy();
        benchmark::ClobberMemory();
    }
    state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(mebibytes));
}

void copyItems(benchmark::State& state, StorageItem const& from, StorageItem const& to)
{
    copyEach(state, [&] {
        if (from.copyFile(to, ReplacementPolicy::Overwrite) != TransactionStatus::Completed)
            state.SkipWithError("the copy was not completed");
    });
}

void copy_memory_StorageItem(benchmark::State& state)
{
    std::fill(target().begin(), target().end(), 'y');
    copyItems(state, makeItem<RegionProvider>(), makeItem<RegionProvider>());
    if (target() != source())
        state.SkipWithError("the copy is not the original");
}
BENCHMARK(copy_memory_StorageItem)->Unit(benchmark::kMillisecond);

/// The target has to get its memory from the system, page by page.
void copy_memory_MemoryProvider(benchmark::State& state)
{
    StorageItem const from = makeItem<MemoryProvider>();
    StorageItem const to = makeItem<MemoryProvider>();
    makeItem<RegionProvider>().copyFile(from, ReplacementPolicy::Overwrite);
    copyItems(state, from, to);
    std::fill(target().begin(), target().end(), 'y');
    to.copyFile(makeItem<RegionProvider>(), ReplacementPolicy::Overwrite);
    if (target() != source())
        state.SkipWithError("the copy is not the original");
}
BENCHMARK(copy_memory_MemoryProvider)->Unit(benchmark::kMillisecond);

void copy_memory_memcpy(benchmark::State& state)
{
    copyEach(state, [] { std::memcpy(target().data(), source().data(), size); });
}
BENCHMARK(copy_memory_memcpy)->Unit(benchmark::kMillisecond);

/// As the provider in memory has to: into memory that nobody has used yet.
void copy_memory_freshMemcpy(benchmark::State& state)
{
    copyEach(state, [] {
        auto const fresh = std::make_unique_for_overwrite<char[]>(size);
        std::memcpy(fresh.get(), source().data(), size);
        benchmark::DoNotOptimize(fresh.get());
    });
}
BENCHMARK(copy_memory_freshMemcpy)->Unit(benchmark::kMillisecond);

} // namespace

int main(int argc, char** argv)
{
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 2;
    source();
    target();
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
}
