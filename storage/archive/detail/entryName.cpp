#include <storage/archive/detail/entryName.hpp>

namespace foundation::storage::archive::detail {

std::u16string_view takeName(std::u16string_view& path)
{
    std::size_t const begin = path.find_first_not_of(u'/');
    if (begin == std::u16string_view::npos) {
        path = {};
        return {};
    }
    path.remove_prefix(begin);
    std::u16string_view const name = path.substr(0, path.find(u'/'));
    path.remove_prefix(name.size());
    return name;
}

bool isSafe(std::u16string_view name)
{
    return !name.empty() && name != u"." && name != u".." && name.find(u'\0') == std::u16string_view::npos;
}

std::u16string safeName(std::u16string_view name)
{
    if (name.empty() || name == u".")
        return std::u16string(nameOfTheNameless);
    if (name == u"..")
        return std::u16string(escapedParent);
    std::u16string safe;
    for (char16_t const c : name) {
        if (c == u'\0')
            safe += escapedNull;
        else
            safe += c;
    }
    return safe;
}

} // namespace foundation::storage::archive::detail
