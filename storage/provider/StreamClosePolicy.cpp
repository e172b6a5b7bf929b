#include <storage/provider/StreamClosePolicy.hpp>

#include <ostream>
#include <string_view>

using namespace std::string_view_literals;

namespace foundation::storage::provider {

std::ostream& operator<<(std::ostream& stream, StreamClosePolicy const& value)
{
    switch (value) {
    case StreamClosePolicy::Commit:
        return stream << "StreamClosePolicy::Commit"sv;
    case StreamClosePolicy::Abort:
        return stream << "StreamClosePolicy::Abort"sv;
    }
    return stream;
}

} // namespace foundation::storage::provider
