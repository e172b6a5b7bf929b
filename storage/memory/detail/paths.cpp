#include <storage/memory/detail/paths.hpp>

#include <algorithm>

namespace foundation::storage::memory::detail {

std::u16string canonicalPath(std::u16string_view path)
{
    std::u16string canonical;
    forEachComponent(path, [&](std::u16string_view component) {
        if (component == u"..")
            canonical.resize(canonical.empty() ? 0 : canonical.rfind(u'/'));
        else if (component != u".")
            canonical.append(1, u'/').append(component);
    });
    return canonical.empty() ? u"/" : canonical;
}

std::u16string_view parentPath(std::u16string_view path)
{
    if (path == u"/")
        return {};
    return path.substr(0, std::max<std::size_t>(path.rfind(u'/'), 1));
}

bool isBelow(std::u16string_view path, std::u16string_view folder)
{
    if (folder == u"/")
        return path != u"/";
    return path.size() > folder.size() && path.starts_with(folder) && path[folder.size()] == u'/';
}

} // namespace foundation::storage::memory::detail
