#include <storage/local/detail/scratchName.hpp>

#include <boost/uuid/random_generator.hpp>
#include <boost/uuid/uuid_io.hpp>

#include <algorithm>

namespace foundation::storage::local::detail {

namespace {

/// `x` is any digit, `v` one of those that say that the UUID is of the usual variant.
constexpr std::string_view form = "xxxxxxxx-xxxx-4xxx-vxxx-xxxxxxxxxxxx.tmp.bak";

bool fits(char c, char place)
{
    constexpr std::string_view digits = "0123456789abcdef";
    constexpr std::string_view variants = "89ab";
    if (place == 'x')
        return digits.find(c) != std::string_view::npos;
    return place == 'v' ? variants.find(c) != std::string_view::npos : c == place;
}

} // namespace

std::string scratchName()
{
    return boost::uuids::to_string(boost::uuids::random_generator()()) + ".tmp.bak";
}

/// The dots and letters of the ending are compared like the hyphens; it holds neither `x` nor `v`.
bool isScratchName(std::string_view name)
{
    return std::equal(name.begin(), name.end(), form.begin(), form.end(), fits);
}

} // namespace foundation::storage::local::detail
