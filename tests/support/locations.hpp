#pragma once

#include <storage/provider/StorageIRI.hpp>
#include <tests/support/generators.hpp>

#include <algorithm>
#include <cstddef>
#include <string>
#include <utility>

/// Locations of every kind, for properties that hold for all of them.
namespace foundation::tests::support {

using storage::provider::StorageIRI;

/// Where the text of a hierarchical location begins: scheme, ':' and perhaps an authority.
inline rc::Gen<Text> hierarchicalStart()
{
    auto const slashed = rc::gen::map(authority(), [](Text const& text) { return Text{u"//" + text.value}; });
    auto const schemeAndColon = rc::gen::map(scheme(), [](Text const& text) { return Text{text.value + u":"}; });
    return concatenate(schemeAndColon, rc::gen::oneOf(rc::gen::just(Text{}), slashed));
}

inline StorageIRI hierarchical(std::u16string const& start, std::u16string const& plainPath)
{
    return StorageIRI(StorageIRI(start + u"/"), plainPath);
}

/// A hierarchical location; at its end there may stand what a container's text must not trip over.
inline rc::Gen<StorageIRI> hierarchicalLocation()
{
    auto const ending = rc::gen::element<std::u16string>(u"", u"", u"?q!/d", u"#f!", u"!", u"!!x", u"?a/b#c!/", u"%21");
    return rc::gen::map(rc::gen::tuple(hierarchicalStart(), normalPath(), ending), [](auto const& parts) {
        StorageIRI const location = hierarchical(std::get<0>(parts), std::get<1>(parts));
        return StorageIRI(location.toString() + std::get<2>(parts));
    });
}

inline rc::Gen<StorageIRI> filePathLocation()
{
    auto const path = rc::gen::weightedOneOf<Text>({{9, normalPath()}, {1, rc::gen::just(Text{})}});
    return rc::gen::map(rc::gen::pair(scheme(), path), [](std::pair<Text, Text> const& parts) {
        return StorageIRI(parts.first.value, fl::filesystem::upath(parts.second.value));
    });
}

inline rc::Gen<StorageIRI> plainLocation()
{
    return rc::gen::oneOf(hierarchicalLocation(), filePathLocation());
}

/// A plain path inside a container: any text at all behind the '/', but no '/' at the end.
inline rc::Gen<Text> innerPath()
{
    auto const any = rc::gen::map(anyText(), [](Text const& text) {
        std::u16string const path = u"/" + text.value;
        return Text{path.substr(0, std::max<std::size_t>(path.find_last_not_of(u'/') + 1, 1))};
    });
    return rc::gen::oneOf(any, normalPath());
}

/// A location inside a container at a location of `inner`.
inline rc::Gen<StorageIRI> containerLocation(rc::Gen<StorageIRI> inner)
{
    return rc::gen::map(rc::gen::tuple(scheme(), std::move(inner), innerPath()), [](auto const& parts) {
        return StorageIRI(std::get<0>(parts), std::get<1>(parts), std::get<2>(parts).value);
    });
}

/// A location of any kind, nested up to three deep.
inline rc::Gen<StorageIRI> anyLocation()
{
    auto const one = containerLocation(plainLocation());
    auto const two = containerLocation(one);
    return rc::gen::oneOf(plainLocation(), one, two, containerLocation(two));
}

} // namespace foundation::tests::support
