#include <storage/provider/InterruptSignal.hpp>

#include <ostream>
#include <string_view>

using namespace std::string_view_literals;

namespace foundation::storage::provider {

std::ostream& operator<<(std::ostream& stream, InterruptSignal const& value)
{
    switch (value) {
    case InterruptSignal::Continue:
        return stream << "InterruptSignal::Continue"sv;
    case InterruptSignal::Abort:
        return stream << "InterruptSignal::Abort"sv;
    }
    return stream;
}

} // namespace foundation::storage::provider
