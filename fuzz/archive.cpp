/// Whatever bytes an archive is made of, it can be listed and read, or is refused by an exception of the library. The
/// format is FUZZED_FORMAT, an enumerator of `ArchiveFormat`.

#include <fuzz/fuzz.hpp>

#include <storage/archive/ArchiveProvider.hpp>
#include <storage/memory/MemoryProvider.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/StorageItem.hpp>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <memory>
#include <string>
#include <vector>

namespace {

using namespace foundation::storage;
using namespace provider;

/// So that an input is done with in no time, whatever it promises.
constexpr archive::ArchiveLimits limits{.entries = 5000,
                                        .indexBytes = std::size_t{4} << 20,
                                        .entryBytes = std::uint64_t{64} << 20,
                                        .bytesOfAnyRatio = std::uint64_t{1} << 20};
constexpr std::size_t mostFiles = 50;
constexpr std::size_t mostBytes = std::size_t{1} << 20;

StorageItem fileOf(std::uint8_t const* data, std::size_t size)
{
    StorageIRI const store(u"mem://fuzz/");
    StorageItem const file(std::make_shared<memory::MemoryProvider>(store), StorageIRI(store, u"archive"));
    auto const stream = file.openStream({ByteStreamAccess::WriteOnly, ByteStreamCreate::Create,
                                         ByteStreamTruncate::TruncateExisting, ByteStreamAppend::Overwrite});
    stream->write(reinterpret_cast<char const*>(data), static_cast<long>(size));
    stream->close();
    return file;
}

/// Calls `action`, whose failures must be those that the library declares.
template <typename Action>
void attempt(Action const& action)
{
    try {
        action();
    } catch (Exception const&) {
    } catch (ByteStreamFailure const&) {
    }
}

std::string readFrom(ByteStream& stream)
{
    std::string content;
    std::array<char, 4096> buffer;
    while (content.size() < mostBytes) {
        long const count = stream.read(buffer.data(), buffer.size());
        if (count == -1)
            break;
        content.append(buffer.data(), static_cast<std::size_t>(count));
    }
    return content;
}

/// What was read once is read again after going back.
void readFile(StorageItem const& file)
{
    auto const stream = file.openReadOnlyStream();
    std::string const content = readFrom(*stream);
    long const middle = static_cast<long>(content.size() / 2);
    stream->seek(middle, std::ios_base::beg);
    if (content.size() < mostBytes && readFrom(*stream) != content.substr(content.size() / 2))
        std::abort();
}

void describe(StorageItem const& item)
{
    static_cast<void>(item.existsExtended());
    static_cast<void>(item.getCanonicalLocation());
    static_cast<void>(item.getExtendedAttributes());
}

std::vector<std::u16string> filesBelow(StorageItem const& root)
{
    std::vector<std::u16string> names;
    attempt([&] {
        auto const listing = root.listAllRecursive();
        for (FolderEntry const& entry : entries(*listing)) {
            if (names.size() < mostFiles && entry.isFile())
                names.push_back(entry.getName());
        }
    });
    return names;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* data, std::size_t size)
{
    StorageItem const container = fileOf(data, size);
    StorageItem const root(
        std::make_shared<archive::ArchiveProvider>(archive::ArchiveFormat::FUZZED_FORMAT, container, limits),
        StorageIRI(u"fuzzed", container.getLocation(), u"/"));
    for (std::u16string const& name : filesBelow(root)) {
        StorageItem const item(root, name);
        attempt([&] { describe(item); });
        attempt([&] { readFile(item); });
    }
    return 0;
}
