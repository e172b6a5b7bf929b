// What does it cost to open a file beneath a root that nothing leads out of, beside a bare openat?

#include "support/Folder.hpp"

#include <storage/local/LocalProvider.hpp>
#include <storage/local/detail/Root.hpp>

#include <benchmark/benchmark.h>

#include <boost/property_tree/ptree.hpp>

#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <linux/openat2.h>
#include <string>
#include <sys/syscall.h>
#include <unistd.h>

namespace {

using namespace foundation::storage;

constexpr int openCount = 10'000;
constexpr char const* name = "reports/2024/july.txt";

/// A folder that holds one file, two folders below.
bench::Folder const& folder()
{
    static bench::Folder const made(0);
    static bool const isFilled = [] {
        std::filesystem::path const file = made.path() / name;
        std::filesystem::create_directories(file.parent_path());
        return std::ofstream(file).put('x').good();
    }();
    if (!isFilled)
        std::abort();
    return made;
}

int rootDescriptor()
{
    static int const descriptor = ::open(folder().path().c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC);
    return descriptor;
}

template <typename Open>
void openEach(benchmark::State& state, Open const& open)
{
    for (auto _ : state) {
        for (int i = 0; i != openCount; ++i) {
            if (!open())
                state.SkipWithError("cannot open");
        }
    }
    state.SetItemsProcessed(state.iterations() * openCount);
}

bool closed(int descriptor)
{
    return descriptor >= 0 && ::close(descriptor) == 0;
}

void open_file_openat(benchmark::State& state)
{
    std::string const path = folder().path() / name;
    openEach(state, [&] { return closed(::openat(AT_FDCWD, path.c_str(), O_RDONLY | O_CLOEXEC)); });
}
BENCHMARK(open_file_openat)->Unit(benchmark::kMillisecond);

void open_file_openatInFolder(benchmark::State& state)
{
    int const root = rootDescriptor();
    openEach(state, [&] { return closed(::openat(root, name, O_RDONLY | O_CLOEXEC)); });
}
BENCHMARK(open_file_openatInFolder)->Unit(benchmark::kMillisecond);

void open_file_openat2(benchmark::State& state)
{
    int const root = rootDescriptor();
    open_how how{};
    how.flags = O_RDONLY | O_CLOEXEC;
    how.resolve = RESOLVE_BENEATH | RESOLVE_NO_MAGICLINKS | RESOLVE_NO_XDEV;
    openEach(state, [&] { return closed(static_cast<int>(::syscall(SYS_openat2, root, name, &how, sizeof how))); });
}
BENCHMARK(open_file_openat2)->Unit(benchmark::kMillisecond);

void open_file_Root(benchmark::State& state)
{
    local::detail::Root const root(folder().path());
    std::string const path = folder().path() / name;
    openEach(state, [&] {
        local::detail::FileDescriptor file;
        return root.open(path, O_RDONLY, file) == 0 && file.close() == 0;
    });
}
BENCHMARK(open_file_Root)->Unit(benchmark::kMillisecond);

void openStreams(benchmark::State& state, local::LocalProvider const& provider)
{
    std::string const path = folder().path() / name;
    provider::StorageIRI const location(u"file://" + std::u16string(path.begin(), path.end()));
    openEach(state, [&] { return provider.openReadOnlyStream(location) != nullptr; });
}

void open_stream_anywhere(benchmark::State& state)
{
    openStreams(state, local::LocalProvider());
}
BENCHMARK(open_stream_anywhere)->Unit(benchmark::kMillisecond);

void open_stream_confined(benchmark::State& state)
{
    local::LocalProvider provider;
    boost::property_tree::ptree settings;
    settings.put("root", folder().path().string());
    provider.configure(settings);
    openStreams(state, provider);
}
BENCHMARK(open_stream_confined)->Unit(benchmark::kMillisecond);

} // namespace

BENCHMARK_MAIN();
