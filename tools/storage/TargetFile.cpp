#include <tools/storage/TargetFile.hpp>

#include <storage/provider/Exception.hpp>

#include <utility>
#include <vector>

namespace foundation::storage::tool {

using provider::ErrorCode;

TargetFile::TargetFile(provider::StorageItem target) : target_(std::move(target)) {}

void TargetFile::write(char const* data, long count)
{
    endHole();
    while (count > 0) {
        long const written = stream().write(data, count);
        if (written <= 0 || written > count)
            throw provider::Exception(ErrorCode::IOError, target_.getLocation());
        data += written;
        count -= written;
    }
}

void TargetFile::writeZeros(long count)
{
    if (target_.getScheme() == u"file")
        hole_ += count;
    else
        write(std::vector<char>(static_cast<std::size_t>(count)).data(), count);
}

/// The last byte of a hole is written, so that the file reaches as far.
void TargetFile::endHole()
{
    long const hole = std::exchange(hole_, 0);
    if (hole == 0)
        return;
    stream().seek(hole - 1, std::ios_base::cur);
    write("", 1);
}

void TargetFile::commit(long expectedSize)
{
    endHole();
    if (stream().seek(0, std::ios_base::end) != expectedSize)
        throw provider::Exception(ErrorCode::IOError, target_.getLocation());
    publish();
}

} // namespace foundation::storage::tool
