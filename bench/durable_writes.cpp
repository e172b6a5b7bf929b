// What does it cost to replace a file of 4 KiB so that the new content survives a power failure, beside the bare
// protocol?
//
// The files are made in a folder below $TMPDIR, and removed afterwards. Run it by bench/on_image: what a disk takes for
// its part drowns what we add.

#include "support/Folder.hpp"

#include <storage/local/LocalProvider.hpp>

#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdio>
#include <fcntl.h>
#include <stdexcept>
#include <string>
#include <unistd.h>

namespace {

using namespace foundation::storage::provider;
using foundation::storage::local::LocalProvider;

constexpr long size = 4096;

void require(bool isDone)
{
    if (!isDone)
        throw std::runtime_error("a call of the bare protocol failed");
}

/// What every durable replacement has to ask of the system, and no more.
void writeBare(std::string const& path, std::string const& content, unsigned number)
{
    int const folder = ::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    std::string const scratch = std::to_string(number) + ".tmp.bak";
    int const file = ::openat(folder, scratch.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
    require(::write(file, content.data(), content.size()) == size);
    require(::fsync(file) == 0);
    require(::renameat(folder, scratch.c_str(), folder, "file") == 0);
    require(::fsync(folder) == 0);
    ::close(file);
    ::close(folder);
}

void writeByProvider(LocalProvider const& provider, StorageIRI const& file, std::string const& content)
{
    auto const stream = provider.openTransactionalStream(file, {});
    require(stream->write(content.data(), size) == size);
    stream->close(StreamClosePolicy::Commit);
}

/// By the wall: most of the time is spent waiting.
template <typename Write>
void measure(benchmark::State& state, Write const& write)
{
    for (auto _ : state) {
        auto const start = std::chrono::steady_clock::now();
        write();
        state.SetIterationTime(std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count());
    }
    state.SetItemsProcessed(state.iterations());
}

void durable_write_bare(benchmark::State& state)
{
    bench::Folder const folder(0);
    std::string const content(size, 'x');
    unsigned number = 0;
    measure(state, [&] { writeBare(folder.path().native(), content, ++number); });
}

void durable_write_LocalProvider(benchmark::State& state)
{
    bench::Folder const folder(0);
    std::string const content(size, 'x');
    LocalProvider const provider;
    std::string const path = (folder.path() / "file").native();
    StorageIRI const file(u"file://" + std::u16string(path.begin(), path.end()));
    measure(state, [&] { writeByProvider(provider, file, content); });
}

BENCHMARK(durable_write_bare)->UseManualTime();
BENCHMARK(durable_write_LocalProvider)->UseManualTime();

} // namespace

BENCHMARK_MAIN();
