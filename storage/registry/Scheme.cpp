#include <storage/registry/Scheme.hpp>

#include <ostream>

namespace foundation::storage::registry {

namespace {

char const* nameOf(SchemeKind kind)
{
    switch (kind) {
    case SchemeKind::Physical:
        return "SchemeKind::Physical";
    case SchemeKind::Container:
        return "SchemeKind::Container";
    }
    return "Unhandled SchemeKind";
}

} // namespace

std::ostream& operator<<(std::ostream& stream, SchemeKind const& kind)
{
    return stream << nameOf(kind);
}

} // namespace foundation::storage::registry
