#include <storage/conformance/detail/aliases.hpp>

#include <algorithm>
#include <stdexcept>

namespace foundation::storage::conformance::detail {

using provider::StorageIRI;

namespace {

StorageIRI withEscapedEnd(StorageIRI const& location)
{
    static constexpr char16_t const digits[] = u"0123456789ABCDEF";
    std::u16string text = location.toString();
    char16_t const last = text.back();
    if (last < u'a' || last > u'z')
        throw std::logic_error("spellings are made of names that end in a letter");
    text.pop_back();
    return StorageIRI(text + u'%' + digits[last / 16] + digits[last % 16]);
}

std::u16string inCapitals(std::u16string name)
{
    std::transform(name.begin(), name.end(), name.begin(), [](char16_t unit) {
        return unit >= u'a' && unit <= u'z' ? static_cast<char16_t>(unit - u'a' + u'A') : unit;
    });
    return name;
}

} // namespace

std::vector<StorageIRI> spellingsOf(Scene const& scene, std::u16string const& name)
{
    std::vector<StorageIRI> spellings{scene.iri(name), withEscapedEnd(scene.iri(name))};
    if (scene.capabilities().resolvesDots)
        spellings.push_back(scene.iri(u"./" + name));
    if (scene.capabilities().resolvesDots && scene.provider().folderExists(scene.iri(u"folder")))
        spellings.push_back(scene.iri(u"folder/../" + name));
    if (!scene.capabilities().caseSensitive)
        spellings.push_back(scene.iri(inCapitals(name)));
    return spellings;
}

} // namespace foundation::storage::conformance::detail
