#include <tests/storage/archive/rawZips.hpp>

#include <stdexcept>
#include <zlib.h>

namespace foundation::storage::archive {

namespace {

template <typename Number>
void append(std::string& bytes, Number number)
{
    for (std::size_t i = 0; i != sizeof(Number); ++i)
        bytes += static_cast<char>(static_cast<unsigned char>(std::uint64_t{number} >> (8 * i)));
}

std::uint32_t checksumOf(std::string const& bytes)
{
    return static_cast<std::uint32_t>(
        ::crc32(0, reinterpret_cast<unsigned char const*>(bytes.data()), static_cast<unsigned>(bytes.size())));
}

std::uint32_t sizeOf(std::string const& bytes)
{
    return static_cast<std::uint32_t>(bytes.size());
}

std::uint16_t shortSizeOf(std::string const& bytes)
{
    return static_cast<std::uint16_t>(bytes.size());
}

/// What the head of an entry and its record in the directory have in common.
std::string description(RawEntry const& entry, std::string const& packed)
{
    std::string bytes;
    append(bytes, std::uint16_t{20});
    append(bytes, entry.flags);
    append(bytes, entry.method);
    append(bytes, std::uint32_t{0x58210000}); // the first of January 2024
    append(bytes, entry.checksum.value_or(checksumOf(entry.content)));
    append(bytes, entry.sizeInArchive.value_or(sizeOf(packed)));
    append(bytes, entry.size.value_or(sizeOf(entry.content)));
    append(bytes, shortSizeOf(entry.name));
    append(bytes, shortSizeOf(entry.extra));
    return bytes;
}

std::string record(RawEntry const& entry, std::string const& packed, std::uint32_t offset)
{
    std::string bytes("PK\x01\x02");
    append(bytes, static_cast<std::uint16_t>(entry.system << 8 | 20));
    bytes += description(entry, packed);
    append(bytes, std::uint16_t{0}); // no comment
    append(bytes, std::uint16_t{0}); // on the first disk
    append(bytes, std::uint16_t{0});
    append(bytes, entry.attributes);
    append(bytes, entry.offset.value_or(offset));
    return bytes + entry.name + entry.extra;
}

std::string endOf(RawZip const& zip, std::uint32_t directory, std::uint32_t directorySize)
{
    auto const count = zip.count.value_or(static_cast<std::uint16_t>(zip.entries.size()));
    std::string bytes("PK\x05\x06");
    append(bytes, zip.disk);
    append(bytes, zip.disk);
    append(bytes, count);
    append(bytes, count);
    append(bytes, directorySize);
    append(bytes, zip.directory.value_or(directory));
    append(bytes, shortSizeOf(zip.comment));
    return bytes + zip.comment;
}

} // namespace

std::string bytesOf(RawZip const& zip)
{
    std::string body = zip.prefix;
    std::string directory;
    auto const place = [&] { return sizeOf(body) - sizeOf(zip.prefix) + zip.prefixSize.value_or(sizeOf(zip.prefix)); };
    for (RawEntry const& entry : zip.entries) {
        std::string const packed = entry.method == 8 ? deflated(entry.content) : entry.content;
        directory += record(entry, packed, place());
        body += "PK\x03\x04" + description(entry, packed) + entry.name + entry.extra + packed;
    }
    return body + directory + endOf(zip, place(), sizeOf(directory));
}

std::string makeRawZip(std::vector<RawEntry> const& entries)
{
    return bytesOf(RawZip{.entries = entries});
}

std::string deflated(std::string const& content)
{
    z_stream stream{};
    if (::deflateInit2(&stream, 9, Z_DEFLATED, -MAX_WBITS, 9, Z_DEFAULT_STRATEGY) != Z_OK)
        throw std::bad_alloc();
    std::string bytes(::deflateBound(&stream, content.size()), '\0');
    std::string input = content;
    stream.next_in = reinterpret_cast<Bytef*>(input.data());
    stream.avail_in = static_cast<unsigned>(input.size());
    stream.next_out = reinterpret_cast<Bytef*>(bytes.data());
    stream.avail_out = static_cast<unsigned>(bytes.size());
    int const result = ::deflate(&stream, Z_FINISH);
    bytes.resize(stream.total_out);
    ::deflateEnd(&stream);
    if (result != Z_STREAM_END)
        throw std::runtime_error("cannot deflate");
    return bytes;
}

std::string extraField(std::uint16_t id, std::string const& data)
{
    std::string bytes;
    append(bytes, id);
    append(bytes, shortSizeOf(data));
    return bytes + data;
}

std::string unicodePath(std::string const& name, std::string const& unicodeName)
{
    std::string data("\x01");
    append(data, checksumOf(name));
    return data + unicodeName;
}

} // namespace foundation::storage::archive
