#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace foundation::storage::archive {

/// What a zip says of an entry, true or not. What is left out is made from the content as it should be.
struct RawEntry
{
    std::string name; ///< any bytes
    std::string content = {};
    std::uint16_t method = 0; ///< the content is packed for 8, and for all others stands as it is
    std::uint16_t flags = 0;
    std::uint16_t system = 3; ///< that has made it: Unix
    std::uint32_t attributes = 0100644u << 16;
    std::string extra = {}; ///< fields of the directory and of the entry
    std::optional<std::uint32_t> checksum = {};
    std::optional<std::uint32_t> size = {}; ///< of the content
    std::optional<std::uint32_t> sizeInArchive = {};
    std::optional<std::uint32_t> offset = {}; ///< of the entry in the archive
};

/// What the end of a zip says, true or not.
struct RawZip
{
    std::vector<RawEntry> entries;
    std::string prefix = {};
    std::string comment = {};
    std::uint16_t disk = 0;
    std::optional<std::uint16_t> count = {};      ///< of entries
    std::optional<std::uint32_t> directory = {};  ///< where it begins
    std::optional<std::uint32_t> prefixSize = {}; ///< by which offsets are moved
};

namespace flags {
inline constexpr std::uint16_t encrypted = 1;
inline constexpr std::uint16_t utf8 = 0x800;
} // namespace flags

inline constexpr std::uint32_t linkAttributes = 0120777u << 16;

/// The bytes of a zip that is as wrong as it is told to be.
std::string bytesOf(RawZip const& zip);
std::string makeRawZip(std::vector<RawEntry> const& entries);

/// Bytes as raw deflate has them.
std::string deflated(std::string const& content);

/// A field of extra data.
std::string extraField(std::uint16_t id, std::string const& data);

/// The data of the field (0x7075) that gives a name in UTF-8 to an entry called `name`.
std::string unicodePath(std::string const& name, std::string const& unicodeName);

} // namespace foundation::storage::archive
