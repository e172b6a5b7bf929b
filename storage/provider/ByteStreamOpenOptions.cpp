#include <storage/provider/ByteStreamOpenOptions.hpp>

#include <ostream>
#include <string_view>

using namespace std::string_view_literals;

namespace foundation::storage::provider {

std::ostream& operator<<(std::ostream& stream, ByteStreamAccess const& value)
{
    return stream << (value == ByteStreamAccess::WriteOnly ? "ByteStreamAccess::WriteOnly"sv
                                                           : "ByteStreamAccess::ReadWrite"sv);
}

std::ostream& operator<<(std::ostream& stream, ByteStreamAppend const& value)
{
    return stream << (value == ByteStreamAppend::Append ? "ByteStreamAppend::Append"sv
                                                        : "ByteStreamAppend::Overwrite"sv);
}

std::ostream& operator<<(std::ostream& stream, ByteStreamCreate const& value)
{
    return stream << (value == ByteStreamCreate::Create ? "ByteStreamCreate::Create"sv
                                                        : "ByteStreamCreate::NeverCreate"sv);
}

std::ostream& operator<<(std::ostream& stream, ByteStreamTruncate const& value)
{
    return stream << (value == ByteStreamTruncate::TruncateExisting ? "ByteStreamTruncate::TruncateExisting"sv
                                                                    : "ByteStreamTruncate::PreserveExisting"sv);
}

std::ostream& operator<<(std::ostream& stream, ByteStreamOpenOptions const& options)
{
    return stream << "ByteStreamOpenOptions: {"sv << options.access << ", "sv << options.create << ", "sv
                  << options.truncate << ", "sv << options.append << "}"sv;
}

} // namespace foundation::storage::provider
