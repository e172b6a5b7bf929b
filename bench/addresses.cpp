// What does it cost to make, take apart, compare and look up an address, beside an owning URL class?

#include "support/Addresses.hpp"
#include "support/Allocations.hpp"

#include <foundation/network/IRI.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <benchmark/benchmark.h>

#include <cstdint>
#include <stdexcept>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#if BENCH_WITH_BOOST_URL
#include <boost/url.hpp>
#endif

namespace {

using foundation::network::IRI;
using foundation::storage::provider::StorageIRI;

constexpr std::size_t addressCount = 10'000;

/// Few enough to stay in the first-level cache, so that a repeated query is measured and not the memory.
constexpr std::size_t hotCount = 8;

std::vector<std::u16string> const& addresses()
{
    static auto const made = bench::makeAddresses(addressCount);
    return made;
}

void keep(auto const& value)
{
    benchmark::DoNotOptimize(&value);
    benchmark::ClobberMemory();
}

template <typename Address>
std::vector<Address> makeAll(std::size_t count)
{
    auto const& texts = addresses();
    return std::vector<Address>(texts.begin(), texts.begin() + static_cast<std::ptrdiff_t>(count));
}

/// Locations that have been asked for path, name and text, so that the answers are there.
std::vector<StorageIRI> makeLocations(std::size_t count)
{
    auto made = makeAll<StorageIRI>(count);
    for (StorageIRI const& location : made) {
        keep(location.getName());
        keep(location.toString());
    }
    return made;
}

/// These have made a relative, too.
std::vector<StorageIRI> const& locations()
{
    static auto const made = [] {
        auto asked = makeLocations(addressCount);
        for (StorageIRI const& location : asked)
            keep(location.getParent());
        return asked;
    }();
    return made;
}

/// Equal locations in other objects.
std::vector<StorageIRI> const& otherLocations()
{
    static auto const made = makeLocations(addressCount);
    return made;
}

/// Runs `work` on each of `items`, and reports the time and the allocations for one.
template <typename Items, typename Work>
void forEach(benchmark::State& state, Items const& items, Work work)
{
    std::uint64_t const before = bench::allocations();
    for (auto _ : state) {
        for (auto const& item : items)
            work(item);
    }
    auto const done = static_cast<double>(state.iterations()) * static_cast<double>(items.size());
    state.SetItemsProcessed(static_cast<std::int64_t>(done));
    state.counters["allocations"] = static_cast<double>(bench::allocations() - before) / done;
}

/// The same on a few locations again and again, whose answers are computed before the clock starts.
template <typename Work>
void repeat(benchmark::State& state, Work work)
{
    auto const hot = makeLocations(hotCount);
    for (StorageIRI const& location : hot)
        work(location);
    forEach(state, hot, work);
}

// Making.

void construct_IRI(benchmark::State& state)
{
    forEach(state, addresses(), [](std::u16string const& text) { keep(IRI(text)); });
}
BENCHMARK(construct_IRI);

void construct_StorageIRI(benchmark::State& state)
{
    forEach(state, addresses(), [](std::u16string const& text) { keep(StorageIRI(text)); });
}
BENCHMARK(construct_StorageIRI);

void parts_StorageIRI(benchmark::State& state)
{
    forEach(state, addresses(), [](std::u16string const& text) {
        StorageIRI const location(text);
        keep(location.getScheme());
        keep(location.getPath());
        keep(location.getName());
        keep(location.getParent());
    });
}
BENCHMARK(parts_StorageIRI);

void child_StorageIRI(benchmark::State& state)
{
    std::u16string const name = u"summary-2024.txt";
    forEach(state, locations(), [&name](StorageIRI const& folder) { keep(StorageIRI(folder, name)); });
}
BENCHMARK(child_StorageIRI);

void child_and_text_StorageIRI(benchmark::State& state)
{
    std::u16string const name = u"summary-2024.txt";
    forEach(state, locations(), [&name](StorageIRI const& folder) { keep(StorageIRI(folder, name).toString()); });
}
BENCHMARK(child_and_text_StorageIRI);

// Comparing.

void equality_StorageIRI(benchmark::State& state)
{
    auto const& others = otherLocations();
    std::size_t next = 0;
    forEach(state, locations(), [&](StorageIRI const& location) { keep(location == others[next++ % addressCount]); });
}
BENCHMARK(equality_StorageIRI);

void hash_StorageIRI(benchmark::State& state)
{
    forEach(state, locations(), [](StorageIRI const& location) { keep(location.hashValue()); });
}
BENCHMARK(hash_StorageIRI);

void text_to_hash_StorageIRI(benchmark::State& state)
{
    forEach(state, addresses(), [](std::u16string const& text) { keep(StorageIRI(text).hashValue()); });
}
BENCHMARK(text_to_hash_StorageIRI);

void lookup_StorageIRI(benchmark::State& state)
{
    std::unordered_map<StorageIRI, std::size_t> map;
    for (StorageIRI const& location : locations())
        map.emplace(location, map.size());
    forEach(state, otherLocations(), [&map](StorageIRI const& key) { keep(map.find(key)->second); });
}
BENCHMARK(lookup_StorageIRI);

// Asking again.

void repeated_getPath(benchmark::State& state)
{
    repeat(state, [](StorageIRI const& location) { keep(location.getPath()); });
}
BENCHMARK(repeated_getPath);

void repeated_getName(benchmark::State& state)
{
    repeat(state, [](StorageIRI const& location) { keep(location.getName()); });
}
BENCHMARK(repeated_getName);

void repeated_toString(benchmark::State& state)
{
    repeat(state, [](StorageIRI const& location) { keep(location.toString()); });
}
BENCHMARK(repeated_toString);

void repeated_getParent(benchmark::State& state)
{
    repeat(state, [](StorageIRI const& location) { keep(location.getParent()); });
}
BENCHMARK(repeated_getParent);

void repeated_equality(benchmark::State& state)
{
    auto const others = makeLocations(hotCount);
    std::size_t next = 0;
    repeat(state, [&](StorageIRI const& location) { keep(location == others[next++ % hotCount]); });
}
BENCHMARK(repeated_equality);

void repeated_order(benchmark::State& state)
{
    auto const others = makeLocations(hotCount);
    std::size_t next = 0;
    repeat(state, [&](StorageIRI const& location) { keep(location < others[next++ % hotCount]); });
}
BENCHMARK(repeated_order);

void repeated_hash(benchmark::State& state)
{
    repeat(state, [](StorageIRI const& location) { keep(location.hashValue()); });
}
BENCHMARK(repeated_hash);

#if BENCH_WITH_BOOST_URL

namespace urls = boost::urls;

urls::url parse(std::string_view text)
{
    return urls::url(urls::parse_uri(text).value());
}

std::vector<std::string> const& urlTexts()
{
    static auto const made = [] {
        std::vector<std::string> texts;
        for (std::u16string const& address : addresses())
            texts.push_back(bench::toURL(address));
        return texts;
    }();
    return made;
}

std::vector<urls::url> makeURLs()
{
    std::vector<urls::url> made;
    for (std::string const& text : urlTexts())
        made.push_back(parse(text));
    return made;
}

std::vector<urls::url> const& parsedURLs()
{
    static auto const made = makeURLs();
    return made;
}

std::vector<urls::url> const& otherURLs()
{
    static auto const made = makeURLs();
    return made;
}

void construct_BoostURL(benchmark::State& state)
{
    forEach(state, urlTexts(), [](std::string const& text) { keep(parse(text)); });
}
BENCHMARK(construct_BoostURL);

void parts_BoostURL(benchmark::State& state)
{
    forEach(state, urlTexts(), [](std::string const& text) {
        urls::url url = parse(text);
        keep(std::string(url.scheme()));
        keep(url.path());
        keep(url.segments().back());
        urls::url parent = url;
        parent.segments().pop_back();
        keep(parent);
    });
}
BENCHMARK(parts_BoostURL);

void child_BoostURL(benchmark::State& state)
{
    forEach(state, parsedURLs(), [](urls::url const& folder) {
        urls::url child = folder;
        child.segments().push_back("summary-2024.txt");
        keep(child);
    });
}
BENCHMARK(child_BoostURL);

void equality_BoostURL(benchmark::State& state)
{
    auto const& others = otherURLs();
    std::size_t next = 0;
    forEach(state, parsedURLs(), [&](urls::url const& url) { keep(url == others[next++ % addressCount]); });
}
BENCHMARK(equality_BoostURL);

void hash_BoostURL(benchmark::State& state)
{
    forEach(state, parsedURLs(),
            [](urls::url const& url) { keep(std::hash<std::string_view>()(std::string_view(url.buffer()))); });
}
BENCHMARK(hash_BoostURL);

void text_to_hash_BoostURL(benchmark::State& state)
{
    forEach(state, urlTexts(), [](std::string const& text) {
        urls::url const url = parse(text);
        keep(std::hash<std::string_view>()(std::string_view(url.buffer())));
    });
}
BENCHMARK(text_to_hash_BoostURL);

void lookup_BoostURL(benchmark::State& state)
{
    std::unordered_map<std::string_view, std::size_t> map;
    for (urls::url const& url : parsedURLs())
        map.emplace(url.buffer(), map.size());
    forEach(state, otherURLs(), [&map](urls::url const& key) { keep(map.find(key.buffer())->second); });
}
BENCHMARK(lookup_BoostURL);

#endif

/// Heap and handle of one location of the kind that `make` fills a vector with.
template <typename Make>
std::string bytesEach(std::size_t handle, Make make)
{
    std::uint64_t const before = bench::heapBytes();
    auto const made = make();
    std::uint64_t const each = (bench::heapBytes() - before) / made.size();
    return std::to_string(each) + " bytes each, of them " + std::to_string(handle) + " in the vector";
}

std::string averageLength(auto const& texts)
{
    std::size_t total = 0;
    for (auto const& text : texts)
        total += text.size();
    return std::to_string(static_cast<double>(total) / static_cast<double>(texts.size()));
}

/// A benchmark of addresses that are read differently would compare nothing.
void checkAddresses()
{
    for (std::u16string const& text : addresses()) {
        if (StorageIRI(text).toString() != text)
            throw std::logic_error("an address does not print as it was written");
    }
    if (bench::fingerprint(addresses()) != 0xa1e71ed7d47f835bU)
        throw std::logic_error("the addresses are not those of the published figures");
}

void addContext()
{
    benchmark::AddCustomContext("addresses", std::to_string(addresses().size()) + ", on average " +
                                                 averageLength(addresses()) + " UTF-16 code units");
    benchmark::AddCustomContext("memory IRI", bytesEach(sizeof(IRI), [] { return makeAll<IRI>(addressCount); }));
    benchmark::AddCustomContext("memory StorageIRI, fresh",
                                bytesEach(sizeof(StorageIRI), [] { return makeAll<StorageIRI>(addressCount); }));
    benchmark::AddCustomContext("memory StorageIRI, asked for path, name and text",
                                bytesEach(sizeof(StorageIRI), [] { return makeLocations(addressCount); }));
#if BENCH_WITH_BOOST_URL
    benchmark::AddCustomContext("Boost.URL text", "on average " + averageLength(urlTexts()) + " characters");
    benchmark::AddCustomContext("memory Boost.URL", bytesEach(sizeof(urls::url), makeURLs));
#endif
}

/// Makes what several benchmarks share, so that none of them pays for it.
void prepare()
{
    locations();
    otherLocations();
#if BENCH_WITH_BOOST_URL
    parsedURLs();
    otherURLs();
#endif
}

} // namespace

int main(int argc, char** argv)
{
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 2;
    checkAddresses();
    prepare();
    addContext();
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
}
