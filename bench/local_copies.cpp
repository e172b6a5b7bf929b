// What does it cost to copy a local file of 128 MiB all-or-nothing and interruptibly, beside `dd bs=1M`?
//
// The files are made in a folder below $TMPDIR, and removed afterwards.

#include "support/Folder.hpp"

#include <storage/local/LocalProvider.hpp>
#include <storage/provider/StorageItem.hpp>

#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <memory>
#include <optional>
#include <spawn.h>
#include <stdexcept>
#include <string>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

namespace {

using namespace foundation::storage::provider;
using foundation::storage::local::LocalProvider;

constexpr std::size_t mebibyte = std::size_t{1} << 20;
constexpr std::size_t mebibytes = 128;

/// A folder with the file to copy.
class Scene
{
public:
    Scene()
    {
        std::vector<char> piece(mebibyte);
        std::ofstream file(source(), std::ios::binary);
        for (std::size_t i = 0; i != mebibytes; ++i) {
            std::fill(piece.begin(), piece.end(), static_cast<char>(i));
            file.write(piece.data(), static_cast<std::streamsize>(piece.size()));
        }
        file.close();
        if (!file)
            throw std::runtime_error("cannot write " + source());
    }

    std::string source() const { return folder_.path() / "source"; }
    std::string target() const { return folder_.path() / "target"; }

private:
    bench::Folder folder_{0};
};

std::optional<Scene> scene;

// Each answers whether it copied the source to the target.

bool copyWithItems()
{
    auto const provider = std::make_shared<LocalProvider>();
    auto const item = [&](std::string const& path) {
        return StorageItem(provider, StorageIRI(StorageIRI(u"file:///"), std::filesystem::path(path).u16string()));
    };
    CopyFileOptions const options{ReplacementPolicy::Overwrite, TransactionPolicy::Atomic,
                                  [] { return InterruptSignal::Continue; }};
    return item(scene->source()).copyFile(item(scene->target()), options) == TransactionStatus::Completed;
}

bool copyWithDd()
{
    std::string arguments[] = {"dd", "if=" + scene->source(), "of=" + scene->target(), "bs=1M", "status=none"};
    std::vector<char*> pointers;
    for (std::string& argument : arguments)
        pointers.push_back(argument.data());
    pointers.push_back(nullptr);
    pid_t child = 0;
    int status = -1;
    return ::posix_spawnp(&child, "dd", nullptr, nullptr, pointers.data(), environ) == 0 &&
           ::waitpid(child, &status, 0) == child && status == 0;
}

/// What `dd` does, without starting a program.
bool copyWithSystemCalls()
{
    static std::vector<char> buffer(mebibyte);
    int const from = ::open(scene->source().c_str(), O_RDONLY | O_CLOEXEC);
    int const to = ::open(scene->target().c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666);
    ssize_t count = 0;
    while ((count = ::read(from, buffer.data(), buffer.size())) > 0) {
        if (::write(to, buffer.data(), static_cast<std::size_t>(count)) != count)
            break;
    }
    ::close(from);
    return ::close(to) == 0 && count == 0;
}

bool isCopied()
{
    std::ifstream left(scene->source(), std::ios::binary);
    std::ifstream right(scene->target(), std::ios::binary);
    using Bytes = std::istreambuf_iterator<char>;
    return std::equal(Bytes(left), Bytes(), Bytes(right), Bytes());
}

enum class Target
{
    New,
    Replaced,
};

template <bool copy(), Target target>
void copying(benchmark::State& state)
{
    using Clock = std::chrono::steady_clock;
    for (auto _ : state) {
        auto const start = Clock::now();
        bool const done = copy();
        state.SetIterationTime(std::chrono::duration<double>(Clock::now() - start).count());
        if (!done || std::filesystem::file_size(scene->target()) != mebibytes * mebibyte)
            state.SkipWithError("the file was not copied");
        if (target == Target::New)
            std::filesystem::remove(scene->target());
    }
    state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(mebibytes));
}

void add(std::string const& name, benchmark::internal::Function* run)
{
    benchmark::RegisterBenchmark(name.c_str(), run)->UseManualTime()->Unit(benchmark::kMillisecond);
}

/// To a new file, and to one that is there already.
template <bool copy()>
void addBoth(std::string const& subject)
{
    if (!copy() || !isCopied())
        throw std::runtime_error(subject + " does not copy");
    add("copy_local_" + subject, copying<copy, Target::New>);
    add("replace_local_" + subject, copying<copy, Target::Replaced>);
}

} // namespace

int main(int argc, char** argv)
{
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 2;
    scene.emplace();
    addBoth<copyWithItems>("StorageItem");
    addBoth<copyWithDd>("dd");
    addBoth<copyWithSystemCalls>("readWrite");
    benchmark::RunSpecifiedBenchmarks();
    scene.reset();
    benchmark::Shutdown();
}
