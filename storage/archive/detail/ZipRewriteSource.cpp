// The old archive and the new one, as libzip reads and writes them.

#include <storage/archive/detail/ZipRewrite.hpp>

#include <zip.h>

namespace foundation::storage::archive::detail {

namespace {

constexpr zip_int64_t supported = ZIP_SOURCE_SUPPORTS_WRITABLE;

} // namespace

std::int64_t ZipRewrite::answer(void* data, std::uint64_t length, int command)
{
    switch (command) {
    case ZIP_SOURCE_OPEN:
        if (reader_)
            reader_->seek(0);
        return 0;
    case ZIP_SOURCE_READ:
        return reader_ ? static_cast<std::int64_t>(reader_->read(static_cast<char*>(data), length)) : 0;
    case ZIP_SOURCE_STAT: {
        zip_stat_t& stat = *static_cast<zip_stat_t*>(data);
        zip_stat_init(&stat);
        stat.valid = ZIP_STAT_SIZE;
        stat.size = reader_ ? reader_->size() : 0;
        return sizeof(stat);
    }
    case ZIP_SOURCE_ERROR:
        return zip_error_to_data(error_.get(), data, length);
    case ZIP_SOURCE_SEEK: {
        if (!reader_)
            return 0;
        zip_int64_t const position =
            zip_source_seek_compute_offset(reader_->position(), reader_->size(), data, length, error_.get());
        if (position < 0)
            return -1;
        reader_->seek(static_cast<std::uint64_t>(position));
        return 0;
    }
    case ZIP_SOURCE_TELL:
        return reader_ ? static_cast<std::int64_t>(reader_->position()) : 0;
    case ZIP_SOURCE_SUPPORTS:
        return supported;
    case ZIP_SOURCE_CLOSE:
    case ZIP_SOURCE_FREE:
        return 0;
    default:
        return answerWriting(data, length, command);
    }
}

std::int64_t ZipRewrite::answerWriting(void* data, std::uint64_t length, int command)
{
    switch (command) {
    case ZIP_SOURCE_WRITE:
        target_.write(static_cast<char const*>(data), length);
        return static_cast<std::int64_t>(length);
    case ZIP_SOURCE_SEEK_WRITE: {
        zip_int64_t const position =
            zip_source_seek_compute_offset(target_.position(), target_.size(), data, length, error_.get());
        if (position < 0)
            return -1;
        target_.seek(static_cast<std::uint64_t>(position));
        return 0;
    }
    case ZIP_SOURCE_TELL_WRITE:
        return static_cast<std::int64_t>(target_.position());
    case ZIP_SOURCE_COMMIT_WRITE:
        target_.commit();
        return 0;
    case ZIP_SOURCE_BEGIN_WRITE:
    case ZIP_SOURCE_ROLLBACK_WRITE: // the target leaves nothing behind unless it is committed
        return 0;
    default:
        zip_error_set(error_.get(), ZIP_ER_OPNOTSUPP, 0);
        return -1;
    }
}

} // namespace foundation::storage::archive::detail
