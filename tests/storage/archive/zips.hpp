#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace foundation::storage::archive {

/// What a zip is to hold under one name.
struct ZipMember
{
    std::string name; ///< in UTF-8; that of a folder ends in '/'
    std::string content = {};
    bool isStored = false;
    std::optional<std::uint32_t> unixMode = {};
    std::optional<std::string> password = {};
};

/// The bytes of a zip made by libzip. Throws `std::runtime_error`.
std::string makeZip(std::vector<ZipMember> const& members);

} // namespace foundation::storage::archive
