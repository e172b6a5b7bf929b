#include <storage/local/detail/extendedAttributes.hpp>

#include <storage/local/detail/attributes.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <memory>
#include <string_view>
#include <sys/sysmacros.h>
#include <utility>

namespace foundation::storage::local::detail {

using provider::ExtendedAttributes;
using provider::StorageIRI;

namespace {

constexpr std::uint64_t blockSize = 512; // whatever the file system calls a block

std::unique_ptr<char[]> makeBuffer()
{
    return std::make_unique_for_overwrite<char[]>(maximumAttributeSize);
}

ExtendedAttributes::Map toAttributes(Status const& status)
{
    ExtendedAttributes::Map attributes{
        {"mode", std::uint32_t{status.stx_mode & 07777u}},
        {"uid", std::uint32_t{status.stx_uid}},
        {"gid", std::uint32_t{status.stx_gid}},
        {"links", std::uint32_t{status.stx_nlink}},
        {"inode", std::uint64_t{status.stx_ino}},
        {"device", std::uint64_t{makedev(status.stx_dev_major, status.stx_dev_minor)}},
        {"allocated", std::uint64_t{status.stx_blocks * blockSize}},
        {"accessTime", toPtime(status.stx_atime)},
        {"changeTime", toPtime(status.stx_ctime)},
    };
    if ((status.stx_mask & STATX_BTIME) != 0)
        attributes.emplace("birthTime", toPtime(status.stx_btime));
    return attributes;
}

/// Gone meanwhile, or not for this user: the name is seen by all, the value only by those who may read the file.
bool isPassedOver(int error)
{
    return error == ENODATA || error == EACCES || error == EPERM;
}

void addUserAttributes(FileDescriptor const& file, StorageIRI const& iri, ExtendedAttributes::Map& attributes)
{
    auto const names = makeBuffer();
    std::size_t end = 0;
    int const error = listAttributes(file, names.get(), end);
    if (error == EOPNOTSUPP)
        return;
    if (error != 0)
        throwError(error, iri);
    auto const value = makeBuffer();
    for (char const* name = names.get(); name < names.get() + end; name += std::strlen(name) + 1) {
        if (!std::string_view(name).starts_with("user."))
            continue;
        std::size_t size = 0;
        int const failure = getAttribute(file, name, value.get(), size);
        if (failure == 0)
            attributes.emplace(name, std::string(value.get(), size));
        else if (!isPassedOver(failure))
            throwError(failure, iri);
    }
}

} // namespace

ExtendedAttributes getExtendedAttributes(Root const& root, StorageIRI const& iri)
{
    FileDescriptor file;
    if (int const error = root.open(root.pathOf(iri), O_PATH, file))
        throwError(error, iri);
    Status status;
    if (int const error = getFullStatus(file, status))
        throwError(error, iri);
    ExtendedAttributes::Map attributes = toAttributes(status);
    addUserAttributes(file, iri, attributes);
    return ExtendedAttributes(std::move(attributes));
}

} // namespace foundation::storage::local::detail
