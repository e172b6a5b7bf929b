#include <fl/filesystem/path_functions.hpp>

#include <algorithm>
#include <string_view>

namespace fl::filesystem::detail {

namespace {

constexpr char16_t separator = u'/';

std::size_t rootLength(std::u16string_view path)
{
    return std::min(path.find_first_not_of(separator), path.size());
}

// The text without the separators at its end; nothing remains of a root.
std::u16string_view withoutTrailingSeparators(std::u16string_view path)
{
    return path.substr(0, path.find_last_not_of(separator) + 1);
}

std::u16string_view withoutLeadingSeparators(std::u16string_view path)
{
    return path.substr(rootLength(path));
}

// Where the last element of a text without trailing separators begins.
std::size_t lastElement(std::u16string_view path)
{
    return path.rfind(separator) + 1;
}

} // namespace

std::u16string make_native_form(std::u16string const& path, bool /*complete*/)
{
    return path;
}

std::u16string make_generic_form(std::u16string const& path)
{
    return path;
}

std::u16string extract_filename(std::u16string const& path)
{
    std::u16string_view const elements = withoutTrailingSeparators(path);
    if (elements.empty()) {
        return path.substr(0, 1);
    }
    return std::u16string(elements.substr(lastElement(elements)));
}

std::u16string extract_parent_path(std::u16string const& path)
{
    std::u16string_view const elements = withoutTrailingSeparators(path);
    std::u16string_view const before = elements.substr(0, lastElement(elements));
    std::u16string_view const parent = withoutTrailingSeparators(before);
    return std::u16string(parent.empty() ? before : parent);
}

std::u16string extract_root_path(std::u16string const& path)
{
    return path.substr(0, rootLength(path));
}

std::size_t get_root_path_length(std::u16string const& path)
{
    return rootLength(path);
}

std::u16string extract_first_element(std::u16string const& pathWithoutRoot)
{
    std::u16string_view const path = withoutLeadingSeparators(pathWithoutRoot);
    return std::u16string(path.substr(0, path.find(separator)));
}

std::u16string move_down(std::u16string const& pathWithoutRoot)
{
    std::u16string_view const path = withoutLeadingSeparators(pathWithoutRoot);
    std::size_t const end = std::min(path.find(separator), path.size());
    return std::u16string(withoutLeadingSeparators(path.substr(end)));
}

bool is_absolute(std::u16string const& path)
{
    return path.starts_with(separator);
}

} // namespace fl::filesystem::detail
