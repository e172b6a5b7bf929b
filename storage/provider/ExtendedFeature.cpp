#include <storage/provider/ExtendedFeature.hpp>

#include <ostream>
#include <string_view>

using namespace std::string_view_literals;

namespace foundation::storage::provider {

std::ostream& operator<<(std::ostream& stream, ExtendedFeature value)
{
    if (value == ExtendedFeature::RecursiveFolderRemoval)
        stream << "ExtendedFeature::RecursiveFolderRemoval"sv;
    return stream;
}

} // namespace foundation::storage::provider
