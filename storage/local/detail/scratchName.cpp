#include <storage/local/detail/scratchName.hpp>

#include <boost/uuid/random_generator.hpp>
#include <boost/uuid/uuid_io.hpp>

#include <algorithm>
#include <type_traits>

namespace foundation::storage::local::detail {

namespace {

/// `x` is any digit, `v` one of those that say that the UUID is of the usual variant.
constexpr std::string_view form = "xxxxxxxx-xxxx-4xxx-vxxx-xxxxxxxxxxxx.tmp.bak";

/// The dots and letters of the ending are compared like the hyphens; it holds neither `x` nor `v`.
bool fits(char32_t c, char place)
{
    constexpr std::u32string_view digits = U"0123456789abcdef";
    constexpr std::u32string_view variants = U"89ab";
    if (place == 'x')
        return digits.find(c) != std::u32string_view::npos;
    if (place == 'v')
        return variants.find(c) != std::u32string_view::npos;
    return c == static_cast<unsigned char>(place);
}

template <typename Text>
bool hasForm(Text const& name)
{
    using Unit = std::make_unsigned_t<typename Text::value_type>;
    auto const fitsPlace = [](auto unit, char place) { return fits(static_cast<Unit>(unit), place); };
    return std::equal(name.begin(), name.end(), form.begin(), form.end(), fitsPlace);
}

} // namespace

std::string scratchName()
{
    return boost::uuids::to_string(boost::uuids::random_generator()()) + ".tmp.bak";
}

bool isScratchName(std::string_view name)
{
    return hasForm(name);
}

bool isScratchName(std::u16string_view name)
{
    return hasForm(name);
}

} // namespace foundation::storage::local::detail
