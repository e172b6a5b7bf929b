#pragma once

#include <map>
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

} // namespace foundation::storage::archive
