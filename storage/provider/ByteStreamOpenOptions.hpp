#pragma once

#include <foundation/export.hpp>

#include <cstdint>
#include <iosfwd>

namespace foundation::storage::provider {

/// What may be done with a stream opened for writing; streams that only read are opened by another operation.
enum class ByteStreamAccess : std::int32_t
{
    WriteOnly,
    ReadWrite, ///< readable as well as writable
};

/// Where writing starts.
enum class ByteStreamAppend : std::int32_t
{
    Append,    ///< every write goes to the end of the file
    Overwrite, ///< from the start of the file
};

/// What opening does about a missing file.
enum class ByteStreamCreate : std::int32_t
{
    Create,      ///< create it
    NeverCreate, ///< fail
};

/// What opening does about existing content.
enum class ByteStreamTruncate : std::int32_t
{
    TruncateExisting, ///< cut it to zero length
    PreserveExisting, ///< keep it
};

/// How a byte stream is opened for writing.
struct ByteStreamOpenOptions
{
    ByteStreamAccess access{};
    ByteStreamCreate create{};
    ByteStreamTruncate truncate{};
    ByteStreamAppend append{};
};

/// Each writes its enumeration's name, "::" and the enumerator; a value other than 0 prints as the second enumerator.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, ByteStreamAccess const& value);
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, ByteStreamAppend const& value);
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, ByteStreamCreate const& value);
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, ByteStreamTruncate const& value);

/// Writes "ByteStreamOpenOptions: {", the four fields in order, separated by ", ", and "}".
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, ByteStreamOpenOptions const& options);

} // namespace foundation::storage::provider
