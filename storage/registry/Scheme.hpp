#pragma once

#include <foundation/export.hpp>

#include <iosfwd>
#include <string>

namespace foundation::storage::registry {

/// What the locations of a scheme name.
enum class SchemeKind
{
    Physical,  ///< places in a store that stands on its own, as in `file:///a`
    Container, ///< places inside a container that has a location itself, as in `zip:file:///a.zip!/b`
};

/// Writes "SchemeKind::" and the enumerator, or "Unhandled SchemeKind" for any other value.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, SchemeKind const& kind);

/// A scheme that a registry serves; its name is in lower case.
struct Scheme
{
    std::u16string name;
    SchemeKind kind;

    bool operator==(Scheme const&) const = default;
};

} // namespace foundation::storage::registry
