#pragma once

#include <fl/filesystem/wildcards.hpp>

#include <optional>
#include <string_view>

namespace foundation::storage::local::detail {

enum class Entries
{
    All,
    Files,
    Folders,
};

enum class Detail
{
    NamesOnly,
    Attributes,
};

/// What a listing gives: an entry of the wanted kind whose own name matches the pattern, where there is one.
struct Selection
{
    Entries entries = Entries::All;
    Detail detail = Detail::Attributes;
    std::optional<fl::filesystem::Wildcards> pattern = {};

    bool wantsKind(bool isFolder) const { return entries == Entries::All || (entries == Entries::Folders) == isFolder; }
    bool wantsName(std::u16string_view name) const { return !pattern || pattern->matches(name); }
};

} // namespace foundation::storage::local::detail
