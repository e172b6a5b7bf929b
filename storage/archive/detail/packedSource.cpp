#include <storage/archive/detail/packedSource.hpp>

#include <exception>
#include <memory>
#include <new>
#include <utility>
#include <zip.h>

namespace foundation::storage::archive::detail {

namespace {

/// What libzip asks of one content.
class PackedSource
{
public:
    PackedSource(PackedPtr packed, std::optional<Fault>& failure) : packed_(std::move(packed)), failure_(failure)
    {
        zip_error_init(&error_);
    }

    zip_int64_t answer(void* data, zip_uint64_t length, zip_source_cmd_t command)
    {
        switch (command) {
        case ZIP_SOURCE_OPEN:
            position_ = 0;
            return 0;
        case ZIP_SOURCE_READ:
            return read(static_cast<char*>(data), length);
        case ZIP_SOURCE_STAT:
            return describe(*static_cast<zip_stat_t*>(data));
        case ZIP_SOURCE_ERROR:
            return zip_error_to_data(&error_, data, length);
        case ZIP_SOURCE_SUPPORTS:
            return ZIP_SOURCE_SUPPORTS_READABLE;
        case ZIP_SOURCE_CLOSE:
            return 0;
        default:
            zip_error_set(&error_, ZIP_ER_OPNOTSUPP, 0);
            return -1;
        }
    }

private:
    /// No exception may pass through libzip.
    zip_int64_t read(char* buffer, zip_uint64_t count)
    {
        try {
            std::size_t const read = packed_->readPacked(position_, buffer, count);
            position_ += read;
            return static_cast<zip_int64_t>(read);
        } catch (Fault const& fault) {
            failure_ = fault;
        } catch (std::exception const&) {
            failure_ = Fault(ArchiveException::Reason::StoreFailed);
        }
        zip_error_set(&error_, ZIP_ER_READ, 0);
        return -1;
    }

    zip_int64_t describe(zip_stat_t& stat) const
    {
        zip_stat_init(&stat);
        stat.valid =
            ZIP_STAT_SIZE | ZIP_STAT_COMP_SIZE | ZIP_STAT_CRC | ZIP_STAT_COMP_METHOD | ZIP_STAT_ENCRYPTION_METHOD;
        stat.size = packed_->size();
        stat.comp_size = packed_->packedSize();
        stat.crc = packed_->checksum();
        stat.comp_method = packed_->isStored() ? ZIP_CM_STORE : ZIP_CM_DEFLATE;
        stat.encryption_method = ZIP_EM_NONE;
        return sizeof(stat);
    }

    PackedPtr const packed_;
    std::optional<Fault>& failure_;
    zip_error_t error_;
    std::uint64_t position_ = 0;
};

zip_int64_t serve(void* self, void* data, zip_uint64_t length, zip_source_cmd_t command)
{
    auto* const source = static_cast<PackedSource*>(self);
    if (command != ZIP_SOURCE_FREE)
        return source->answer(data, length, command);
    delete source;
    return 0;
}

} // namespace

::zip_source* makePackedSource(::zip* archive, PackedPtr packed, std::optional<Fault>& failure)
{
    auto content = std::make_unique<PackedSource>(std::move(packed), failure);
    ::zip_source* const source = zip_source_function(archive, serve, content.get());
    if (source == nullptr)
        throw std::bad_alloc();
    static_cast<void>(content.release()); // libzip frees it with the source
    return source;
}

} // namespace foundation::storage::archive::detail
