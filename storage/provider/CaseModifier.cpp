#include <storage/provider/CaseModifier.hpp>

#include <ostream>
#include <string_view>

using namespace std::string_view_literals;

namespace foundation::storage::provider {

std::ostream& operator<<(std::ostream& stream, CaseModifier value)
{
    switch (value) {
    case CaseModifier::None:
        return stream << "CaseModifier::None"sv;
    case CaseModifier::Sensitive:
        return stream << "CaseModifier::Sensitive"sv;
    case CaseModifier::InSensitive:
        return stream << "CaseModifier::InSensitive"sv;
    }
    return stream;
}

} // namespace foundation::storage::provider
