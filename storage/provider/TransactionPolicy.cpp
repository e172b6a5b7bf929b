#include <storage/provider/TransactionPolicy.hpp>

#include <ostream>
#include <string_view>

using namespace std::string_view_literals;

namespace foundation::storage::provider {

std::ostream& operator<<(std::ostream& stream, TransactionPolicy const& value)
{
    switch (value) {
    case TransactionPolicy::NonAtomic:
        return stream << "TransactionPolicy::NonAtomic"sv;
    case TransactionPolicy::Atomic:
        return stream << "TransactionPolicy::Atomic"sv;
    }
    return stream;
}

} // namespace foundation::storage::provider
