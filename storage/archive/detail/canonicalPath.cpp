#include <storage/archive/detail/canonicalPath.hpp>

#include <storage/archive/detail/entryName.hpp>

#include <vector>

namespace foundation::storage::archive::detail {

namespace {

/// Empty for the root.
std::u16string pathOf(Index const& index, Index::Id id)
{
    std::vector<Index::Id> way;
    for (; id != Index::root; id = index.at(id).parent)
        way.push_back(id);
    std::u16string path;
    for (auto step = way.rbegin(); step != way.rend(); ++step)
        path.append(1, u'/').append(index.name(*step));
    return path;
}

} // namespace

std::u16string canonicalPath(std::u16string_view path)
{
    std::u16string canonical;
    for (std::u16string_view name = takeName(path); !name.empty(); name = takeName(path)) {
        if (name == u"..")
            canonical.resize(canonical.empty() ? 0 : canonical.rfind(u'/'));
        else if (name != u".")
            canonical.append(1, u'/').append(name);
    }
    return canonical.empty() ? u"/" : canonical;
}

std::u16string canonicalPath(Index const& index, std::u16string_view path)
{
    std::u16string_view existing = path;
    auto place = index.find(existing, Index::LastLink::Follow);
    while (!place.id) {
        existing = existing.substr(0, existing.find_last_of(u'/'));
        place = index.find(existing, Index::LastLink::Follow);
    }
    std::u16string const canonical = pathOf(index, *place.id).append(path.substr(existing.size()));
    return canonical.empty() ? u"/" : canonical;
}

} // namespace foundation::storage::archive::detail
