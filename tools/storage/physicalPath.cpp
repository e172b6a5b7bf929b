#include <tools/storage/physicalPath.hpp>

#include <fl/filesystem/exceptions.hpp>
#include <fl/filesystem/upath.hpp>
#include <fl/filesystem/volume.hpp>
#include <fl/i18n/case.hpp>
#include <foundation/ustring.hpp>
#include <tools/storage/describe.hpp>

#include <optional>

namespace foundation::storage::tool {

namespace {

/// Empty where nothing is, or nothing can be, as under a name that is too long.
std::optional<std::u16string> resolved(std::u16string const& path)
{
    try {
        return fl::filesystem::get_pathname_from_volume(fl::filesystem::upath(path), fl::filesystem::upath()).string();
    } catch (fl::filesystem::PathNotFound const&) {
        return std::nullopt;
    } catch (fl::filesystem::InvalidArgument const&) {
        return std::nullopt;
    }
}

std::u16string joined(std::u16string const& folder, std::u16string const& name)
{
    return folder == u"/" ? folder + name : folder + u'/' + name;
}

/// The way to the innermost folder that exists, without links and dots, and the rest as it is written.
std::u16string resolvedAsFarAsItExists(std::u16string const& path)
{
    std::u16string existing = path;
    std::u16string rest;
    for (;;) {
        if (auto const found = resolved(existing))
            return rest.empty() ? *found : joined(*found, rest);
        std::size_t const slash = existing.rfind(u'/');
        if (slash == std::u16string::npos || existing == u"/")
            return path;
        std::u16string const name = existing.substr(slash + 1);
        rest = rest.empty() ? name : joined(name, rest);
        existing.resize(slash == 0 ? 1 : slash);
    }
}

} // namespace

bool isLocal(Place const& place)
{
    return ustring::transform(place.item().getLocation().getScheme(), fl::i18n::to_lower) == u"file";
}

std::u16string physicalPath(Place const& place)
{
    return at(place, [&]() -> std::u16string {
        provider::StorageIRI const location = place.item().getCanonicalLocation();
        if (location.isOpaque() || location.hasInnerIRI() || place.item().getScheme() != u"file")
            return location.toString();
        return resolvedAsFarAsItExists(place.item().getLocation().getPath());
    });
}

bool isSame(Place const& left, Place const& right)
{
    return left.item().hasSameProviderInstance(right.item()) && physicalPath(left) == physicalPath(right);
}

bool liesInside(Place const& inner, Place const& outer)
{
    if (!inner.item().hasSameProviderInstance(outer.item()))
        return false;
    std::u16string const folder = physicalPath(outer);
    std::u16string const prefix = folder.ends_with(u'/') ? folder : folder + u'/';
    std::u16string const path = physicalPath(inner);
    return path.size() > prefix.size() && path.starts_with(prefix);
}

} // namespace foundation::storage::tool
