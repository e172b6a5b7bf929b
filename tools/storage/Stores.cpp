#include <tools/storage/Stores.hpp>

#include <fl/filesystem/native_name.hpp>
#include <fl/filesystem/upath.hpp>
#include <fl/i18n/utf8.hpp>
#include <storage/local/LocalProvider.hpp>
#include <tools/storage/Failure.hpp>

#include <cerrno>
#include <fmt/format.h>
#include <memory>
#include <stdlib.h>
#include <system_error>
#include <unistd.h>

namespace foundation::storage::tool {

namespace {

using provider::StorageIRI;

std::string workingDirectory()
{
    std::unique_ptr<char, decltype(&::free)> const folder(::getcwd(nullptr, 0), &::free);
    if (folder == nullptr)
        throw Failure{".", "the working directory: " + std::generic_category().message(errno)};
    return folder.get();
}

/// Joined as bytes, since neither half need be text, with "." and ".." left for the store to follow.
StorageIRI locationOfPath(std::string const& path)
{
    if (path.empty())
        throw Failure{"''", "an empty path names nothing"};
    std::string const absolute = path.front() == '/' ? path : workingDirectory() + '/' + path;
    fl::filesystem::upath const normal(fl::filesystem::from_native_bytes(absolute));
    return StorageIRI(StorageIRI(u"file:///"), normal.string());
}

StorageIRI locationOfIRI(std::string const& text)
{
    try {
        return StorageIRI(fl::i18n::from_utf8(text, fl::i18n::Malformed::Throw));
    } catch (std::exception const& error) {
        throw Failure{text, fmt::format("not a location: {} (for a local path, write ./{})", error.what(), text)};
    }
}

bool isFileScheme(std::string scheme)
{
    for (char& c : scheme)
        c = c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    return scheme == "file";
}

} // namespace

Stores::Stores() : local_(std::make_shared<local::LocalProvider>()) {}

provider::StorageItem Stores::openItem(std::string const& argument) const
{
    if (!isIRI(argument))
        return {local_, locationOfPath(argument)};
    std::string const scheme = argument.substr(0, argument.find(':'));
    if (!isFileScheme(scheme))
        throw Failure{argument,
                      fmt::format("no store serves the scheme '{}' (for a local path, write ./{})", scheme, argument)};
    if (argument.find_first_of("?#") != std::string::npos)
        throw Failure{argument, "a '?' or '#' that belongs to a name is written %3F or %23"};
    return {local_, locationOfIRI(argument)};
}

} // namespace foundation::storage::tool
