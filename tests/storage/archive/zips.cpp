#include <tests/storage/archive/zips.hpp>

#include <stdexcept>
#include <zip.h>

namespace foundation::storage::archive {

namespace {

void require(bool condition, char const* step)
{
    if (!condition)
        throw std::runtime_error(std::string("cannot make a zip: ") + step);
}

void addMember(zip_t* zip, ZipMember const& member)
{
    if (member.name.ends_with('/')) {
        require(zip_dir_add(zip, member.name.c_str(), ZIP_FL_ENC_GUESS) >= 0, "add a folder");
        return;
    }
    zip_source_t* const source = zip_source_buffer(zip, member.content.data(), member.content.size(), 0);
    zip_int64_t const added = zip_file_add(zip, member.name.c_str(), source, ZIP_FL_ENC_GUESS);
    require(added >= 0, "add a file");
    zip_uint64_t const index = static_cast<zip_uint64_t>(added);
    require(zip_set_file_compression(zip, index, member.isStored ? ZIP_CM_STORE : ZIP_CM_DEFLATE, 0) == 0, "compress");
    if (member.unixMode)
        require(zip_file_set_external_attributes(zip, index, 0, ZIP_OPSYS_UNIX, *member.unixMode << 16) == 0, "mode");
    if (member.password)
        require(zip_file_set_encryption(zip, index, ZIP_EM_AES_256, member.password->c_str()) == 0, "encrypt");
}

} // namespace

std::string makeZip(std::vector<ZipMember> const& members)
{
    if (members.empty()) // libzip makes nothing of nothing, where others write the end of a directory
        return std::string("PK\x05\x06", 4) + std::string(18, '\0');
    zip_error_t error;
    zip_error_init(&error);
    zip_source_t* const buffer = zip_source_buffer_create(nullptr, 0, 0, &error);
    zip_source_keep(buffer);
    zip_t* const zip = zip_open_from_source(buffer, ZIP_TRUNCATE, &error);
    require(zip != nullptr, "open");
    for (ZipMember const& member : members)
        addMember(zip, member);
    require(zip_close(zip) == 0, "close");
    zip_stat_t stat;
    require(zip_source_stat(buffer, &stat) == 0 && zip_source_open(buffer) == 0, "find out the size");
    std::string bytes(stat.size, '\0');
    require(zip_source_read(buffer, bytes.data(), bytes.size()) == static_cast<zip_int64_t>(bytes.size()), "read");
    zip_source_close(buffer);
    zip_source_free(buffer);
    return bytes;
}

} // namespace foundation::storage::archive
