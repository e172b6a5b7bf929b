#pragma once

#include <foundation/export.hpp>

#include <string>
#include <string_view>

namespace foundation::storage::memory::detail {

/// Calls `step` with each component of a path; separators in a row count as one.
template <typename Step>
void forEachComponent(std::u16string_view path, Step const& step)
{
    while (!path.empty()) {
        std::u16string_view const component = path.substr(0, path.find(u'/'));
        path.remove_prefix(component.size() + (component.size() < path.size() ? 1 : 0));
        if (!component.empty())
            step(component);
    }
}

/// The one way to write a path: single separators, none at the end but the root's, and no "." and "..".
FOUNDATION_API std::u16string canonicalPath(std::u16string_view path);

/// The folder that a canonical path lies in; empty for the root.
FOUNDATION_API std::u16string_view parentPath(std::u16string_view path);

/// Whether a canonical path lies below another, at any depth.
FOUNDATION_API bool isBelow(std::u16string_view path, std::u16string_view folder);

} // namespace foundation::storage::memory::detail
