#include <storage/provider/ReplacementPolicy.hpp>

#include <ostream>
#include <string_view>

using namespace std::string_view_literals;

namespace foundation::storage::provider {

std::ostream& operator<<(std::ostream& stream, ReplacementPolicy value)
{
    switch (value) {
    case ReplacementPolicy::Preserve:
        return stream << "ReplacementPolicy::Preserve"sv;
    case ReplacementPolicy::Overwrite:
        return stream << "ReplacementPolicy::Overwrite"sv;
    case ReplacementPolicy::Clobber:
        return stream << "ReplacementPolicy::Clobber"sv;
    case ReplacementPolicy::NoClobber:
        return stream << "ReplacementPolicy::NoClobber"sv;
    }
    return stream;
}

} // namespace foundation::storage::provider
