#include <storage/provider/ExistenceType.hpp>

#include <ostream>
#include <string_view>

using namespace std::string_view_literals;

namespace foundation::storage::provider {

std::ostream& operator<<(std::ostream& stream, ExistenceType const& value)
{
    switch (value) {
    case ExistenceType::AsFile:
        return stream << "AsFile"sv;
    case ExistenceType::AsFolder:
        return stream << "AsFolder"sv;
    case ExistenceType::AsNeither:
        return stream << "AsNeither"sv;
    }
    stream.setstate(std::ios_base::failbit);
    return stream;
}

std::ostream& operator<<(std::ostream& stream, ExistenceTypeExtended const& value)
{
    switch (value) {
    case ExistenceTypeExtended::RegularFile:
        return stream << "RegularFile"sv;
    case ExistenceTypeExtended::SpecialFile:
        return stream << "SpecialFile"sv;
    case ExistenceTypeExtended::RegularFolder:
        return stream << "RegularFolder"sv;
    case ExistenceTypeExtended::SymlinkToFile:
        return stream << "SymlinkToFile"sv;
    case ExistenceTypeExtended::SymlinkToFolder:
        return stream << "SymlinkToFolder"sv;
    case ExistenceTypeExtended::BrokenSymlink:
        return stream << "BrokenSymlink"sv;
    case ExistenceTypeExtended::None:
        return stream << "None"sv;
    }
    return stream;
}

} // namespace foundation::storage::provider
