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

bool isDeeper(std::u16string_view path, std::size_t depth)
{
    if (path.size() <= depth)
        return false;
    std::size_t names = 0;
    while (names <= depth && !takeName(path).empty())
        ++names;
    return names > depth;
}

std::u16string inOneName(std::u16string_view path)
{
    std::u16string one;
    for (std::u16string_view name = takeName(path); !name.empty(); name = takeName(path))
        one.append(one.empty() ? std::u16string_view() : escapedSeparator).append(name);
    return one;
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
