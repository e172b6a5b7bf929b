// What does it cost to list a large folder, names only and with attributes, beside the standard library and the bare
// system calls?
//
// The folder is made below $TMPDIR, and removed afterwards.

#include "support/Folder.hpp"

#include <storage/local/LocalProvider.hpp>

#include <benchmark/benchmark.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <dirent.h>
#include <fcntl.h>
#include <filesystem>
#include <optional>
#include <string>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

using foundation::storage::local::LocalProvider;
using foundation::storage::provider::FolderEntry;
using foundation::storage::provider::StorageIRI;

constexpr std::size_t entryCount = 100'000;

std::optional<bench::Folder> folder;

StorageIRI locationOf(bench::Folder const& listed)
{
    return StorageIRI(StorageIRI(u"file:///"), listed.path().u16string());
}

// Each answers the length of all names together, so that it has to look at every one.

std::size_t listWithProvider(bench::Folder const& listed)
{
    LocalProvider const provider;
    auto const listing = provider.listFilesNamesOnly(locationOf(listed));
    std::size_t total = 0;
    for (FolderEntry const& entry : entries(*listing))
        total += entry.getName().size();
    return total;
}

std::size_t listWithStandardLibrary(bench::Folder const& listed)
{
    std::size_t const before = listed.path().native().size() + 1;
    std::size_t total = 0;
    for (auto const& entry : std::filesystem::directory_iterator(listed.path()))
        total += entry.path().native().size() - before;
    return total;
}

std::size_t listAttributesWithProvider(bench::Folder const& listed)
{
    LocalProvider const provider;
    auto const listing = provider.listAll(locationOf(listed));
    std::size_t total = 0;
    for (FolderEntry const& entry : entries(*listing)) {
        auto const modified = entry.getFileAttributes()->getLastModified();
        benchmark::DoNotOptimize(modified);
        total += entry.getName().size() + entry.getFileAttributes()->getSize();
    }
    return total;
}

/// Calls `use` with the descriptor of the folder and each name in it.
template <typename Use>
void forEachName(bench::Folder const& listed, Use const& use)
{
    alignas(dirent64) static std::array<char, 32 * 1024> buffer;
    int const descriptor = ::open(listed.path().c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    for (ssize_t size; (size = ::getdents64(descriptor, buffer.data(), buffer.size())) > 0;) {
        for (char const* record = buffer.data(); record != buffer.data() + size;) {
            char const* const name = record + offsetof(dirent64, d_name);
            if (name[0] != '.')
                use(descriptor, name);
            std::uint16_t length;
            std::memcpy(&length, record + offsetof(dirent64, d_reclen), sizeof length);
            record += length;
        }
    }
    ::close(descriptor);
}

std::size_t listWithSystemCalls(bench::Folder const& listed)
{
    std::size_t total = 0;
    forEachName(listed, [&](int, char const* name) { total += std::strlen(name); });
    return total;
}

std::size_t listAttributesWithSystemCalls(bench::Folder const& listed)
{
    std::size_t total = 0;
    forEachName(listed, [&](int descriptor, char const* name) {
        struct statx status;
        if (::statx(descriptor, name, AT_NO_AUTOMOUNT, STATX_TYPE | STATX_SIZE | STATX_MTIME, &status) == 0)
            total += std::strlen(name) + status.stx_size;
    });
    return total;
}

template <std::size_t list(bench::Folder const&)>
void listing(benchmark::State& state)
{
    for (auto _ : state) {
        if (list(*folder) != folder->lengthOfNames())
            state.SkipWithError("the listing is not that of the folder");
    }
    state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(entryCount));
}

BENCHMARK(listing<listWithProvider>)->Name("names_LocalProvider")->Unit(benchmark::kMillisecond);
BENCHMARK(listing<listWithStandardLibrary>)->Name("names_directory_iterator")->Unit(benchmark::kMillisecond);
BENCHMARK(listing<listWithSystemCalls>)->Name("names_getdents64")->Unit(benchmark::kMillisecond);
BENCHMARK(listing<listAttributesWithProvider>)->Name("attributes_LocalProvider")->Unit(benchmark::kMillisecond);
BENCHMARK(listing<listAttributesWithSystemCalls>)->Name("attributes_statx")->Unit(benchmark::kMillisecond);

long peakMemory()
{
    rusage usage{};
    ::getrusage(RUSAGE_SELF, &usage);
    return usage.ru_maxrss;
}

/// By how many KiB the peak memory of a process of its own grows while it lists; -1 when it fails.
long growthOf(std::size_t list(bench::Folder const&), bench::Folder const& listed)
{
    std::array<int, 2> channel{};
    if (::pipe(channel.data()) != 0)
        return -1;
    pid_t const child = ::fork();
    if (child == 0) {
        long const before = peakMemory();
        bool const complete = list(listed) == listed.lengthOfNames();
        long const growth = complete ? peakMemory() - before : -1;
        ::_exit(::write(channel[1], &growth, sizeof growth) == sizeof growth ? 0 : 1);
    }
    ::close(channel[1]);
    long growth = -1;
    if (::read(channel[0], &growth, sizeof growth) != sizeof growth)
        growth = -1;
    ::close(channel[0]);
    ::waitpid(child, nullptr, 0);
    return growth;
}

void addMemory(std::size_t count)
{
    bench::Folder const listed(count);
    benchmark::AddCustomContext("memory to list " + std::to_string(count),
                                std::to_string(growthOf(listWithProvider, listed)) + " KiB (with attributes " +
                                    std::to_string(growthOf(listAttributesWithProvider, listed)) +
                                    " KiB, directory_iterator " +
                                    std::to_string(growthOf(listWithStandardLibrary, listed)) + " KiB)");
}

} // namespace

int main(int argc, char** argv)
{
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 2;
    for (std::size_t const count : {1'000U, 100'000U, 1'000'000U})
        addMemory(count);
    folder.emplace(entryCount);
    benchmark::RunSpecifiedBenchmarks();
    folder.reset();
    benchmark::Shutdown();
}
