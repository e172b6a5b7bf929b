#include <storage/archive/detail/zipTimes.hpp>

#include <array>
#include <cstddef>
#include <limits>
#include <zip.h>

namespace foundation::storage::archive::detail {

namespace {

/// A byte that says which times are there, then seconds since 1970 in 32 bits, of the modification first.
constexpr zip_uint16_t unixField = 0x5455;
constexpr std::size_t unixFieldSize = 5;
constexpr zip_uint8_t hasModification = 1;

/// Four bytes of nothing, then attributes: tag, size and, of tag 1, times in tenths of microseconds since 1601, of the
/// modification first.
constexpr zip_uint16_t ntfsField = 0x000A;
constexpr std::size_t ntfsFieldSize = 32;
constexpr std::size_t ntfsTime = 8;
constexpr std::int64_t ntfsEpoch = -11'644'473'600'000'000;

constexpr std::int64_t second = 1'000'000;

std::uint64_t numberAt(zip_uint8_t const* bytes, std::size_t size)
{
    std::uint64_t number = 0;
    for (std::size_t i = 0; i != size; ++i)
        number |= std::uint64_t{bytes[i]} << (8 * i);
    return number;
}

void putNumber(zip_uint8_t* bytes, std::uint64_t number, std::size_t size)
{
    for (std::size_t i = 0; i != size; ++i)
        bytes[i] = static_cast<zip_uint8_t>(number >> (8 * i));
}

bool fitsUnixField(std::int64_t seconds)
{
    return seconds >= std::numeric_limits<std::int32_t>::min() && seconds <= std::numeric_limits<std::int32_t>::max();
}

bool removeField(::zip* archive, std::uint64_t number, zip_uint16_t field)
{
    while (zip_file_extra_fields_count_by_id(archive, number, field, ZIP_FL_CENTRAL) > 0) {
        if (zip_file_extra_field_delete_by_id(archive, number, field, 0, ZIP_FL_CENTRAL) != 0)
            return false;
    }
    while (zip_file_extra_fields_count_by_id(archive, number, field, ZIP_FL_LOCAL) > 0) {
        if (zip_file_extra_field_delete_by_id(archive, number, field, 0, ZIP_FL_LOCAL) != 0)
            return false;
    }
    return true;
}

bool addField(::zip* archive, std::uint64_t number, zip_uint16_t field, zip_uint8_t const* data, std::size_t size)
{
    return zip_file_extra_field_set(archive, number, field, ZIP_EXTRA_FIELD_NEW, data, static_cast<zip_uint16_t>(size),
                                    ZIP_FL_CENTRAL | ZIP_FL_LOCAL) == 0;
}

bool addUnixField(::zip* archive, std::uint64_t number, std::int64_t seconds)
{
    std::array<zip_uint8_t, unixFieldSize> data{hasModification};
    putNumber(data.data() + 1, static_cast<std::uint64_t>(seconds), 4);
    return addField(archive, number, unixField, data.data(), data.size());
}

bool addNtfsField(::zip* archive, std::uint64_t number, std::int64_t microseconds)
{
    std::array<zip_uint8_t, ntfsFieldSize> data{};
    data[4] = 1;
    data[6] = ntfsFieldSize - ntfsTime;
    for (std::size_t at = ntfsTime; at != ntfsFieldSize; at += 8)
        putNumber(data.data() + at, static_cast<std::uint64_t>(microseconds - ntfsEpoch) * 10, 8);
    return addField(archive, number, ntfsField, data.data(), data.size());
}

} // namespace

std::optional<std::int64_t> utcTimeOfEntry(::zip* archive, std::uint64_t number)
{
    zip_uint16_t length = 0;
    zip_uint8_t const* field = zip_file_extra_field_get_by_id(archive, number, unixField, 0, &length, ZIP_FL_CENTRAL);
    if (field != nullptr && length >= unixFieldSize && (field[0] & hasModification) != 0)
        return static_cast<std::int32_t>(numberAt(field + 1, 4)) * second;
    field = zip_file_extra_field_get_by_id(archive, number, ntfsField, 0, &length, ZIP_FL_CENTRAL);
    bool const isUsual = field != nullptr && length >= ntfsFieldSize && numberAt(field + 4, 2) == 1;
    if (!isUsual || numberAt(field + ntfsTime, 8) == 0)
        return std::nullopt;
    return static_cast<std::int64_t>(numberAt(field + ntfsTime, 8) / 10) + ntfsEpoch;
}

/// Fields that others might read instead go.
bool setTimeOfEntry(::zip* archive, std::uint64_t number, std::int64_t microseconds)
{
    std::int64_t const seconds = microseconds / second;
    if (!removeField(archive, number, unixField) || !removeField(archive, number, ntfsField))
        return false;
    if (zip_file_set_mtime(archive, number, static_cast<time_t>(seconds), 0) != 0)
        return false;
    return fitsUnixField(seconds) ? addUnixField(archive, number, seconds)
                                  : addNtfsField(archive, number, microseconds);
}

} // namespace foundation::storage::archive::detail
