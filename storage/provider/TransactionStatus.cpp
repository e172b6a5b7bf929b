#include <storage/provider/TransactionStatus.hpp>

#include <ostream>
#include <string_view>

using namespace std::string_view_literals;

namespace foundation::storage::provider {

std::ostream& operator<<(std::ostream& stream, TransactionStatus const& value)
{
    switch (value) {
    case TransactionStatus::Completed:
        return stream << "TransactionStatus::Completed"sv;
    case TransactionStatus::Aborted:
        return stream << "TransactionStatus::Aborted"sv;
    }
    return stream;
}

} // namespace foundation::storage::provider
