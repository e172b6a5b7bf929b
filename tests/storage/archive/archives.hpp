#pragma once

#include <storage/archive/ArchiveException.hpp>
#include <storage/archive/ArchiveFormat.hpp>

#include <cstddef>
#include <stdexcept>
#include <string>
#include <vector>

namespace foundation::storage::archive {

/// What an archive is to hold under one name.
struct Member
{
    std::string name; ///< in UTF-8; that of a folder ends in '/'
    std::string content = {};
    std::string linkTarget = {};     ///< of a symbolic link
    std::string hardLinkTarget = {}; ///< of a hard link
    bool isPipe = false;
};

/// The bytes of an archive made by libarchive, in a format and with a compression as libarchive calls them.
/// Throws `std::runtime_error`.
std::string makeArchive(std::string const& format, std::string const& compression, std::vector<Member> const& members);

/// A way to make archives of a format with `makeArchive`.
struct Kind
{
    char const* name;
    ArchiveFormat format;
    char const* writer;
    char const* compression = "";
};

/// Those that libarchive reads.
std::vector<Kind> kindsOfArchives();

/// Numbers in a row, so that each place has content of its own.
std::string numbers(std::size_t size);

/// Why an action fails.
template <typename Action>
ArchiveException::Reason reasonOf(Action const& action)
{
    try {
        action();
    } catch (ArchiveException const& error) {
        return error.getReason();
    }
    throw std::logic_error("no ArchiveException");
}

} // namespace foundation::storage::archive
