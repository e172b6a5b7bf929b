#include <storage/archive/detail/Index.hpp>

#include <storage/archive/detail/entryName.hpp>

#include <cstring>

namespace foundation::storage::archive::detail {

namespace {

constexpr std::uint64_t mixed(std::uint64_t a, std::uint64_t b)
{
    __extension__ using Wide = unsigned __int128;
    Wide const product = static_cast<Wide>(a) * b;
    return static_cast<std::uint64_t>(product) ^ static_cast<std::uint64_t>(product >> 64);
}

constexpr std::uint64_t oddFactor = 0x9E3779B97F4A7C15;

} // namespace

/// Keyed, so that whoever makes an archive cannot have all its names meet in one slot.
std::uint64_t Index::hash(Id folder, std::u16string_view name) const
{
    std::uint64_t state = mixed(seed_ ^ folder, oddFactor);
    while (!name.empty()) {
        std::u16string_view const block = name.substr(0, 4);
        std::uint64_t bits = 0;
        std::memcpy(&bits, block.data(), block.size() * sizeof(char16_t));
        state = mixed(state ^ bits, oddFactor ^ block.size());
        name.remove_prefix(block.size());
    }
    return mixed(state ^ seed_, oddFactor);
}

/// The slot of the entry, or the empty one where it belongs.
std::size_t Index::slotOf(Id folder, std::u16string_view name) const
{
    std::size_t const mask = slots_.size() - 1;
    std::size_t slot = hash(folder, name) & mask;
    while (slots_[slot] != root && (nodes_[slots_[slot]].parent != folder || nameOf(nodes_[slots_[slot]]) != name))
        slot = (slot + 1) & mask;
    return slot;
}

std::optional<Index::Id> Index::child(Id folder, std::u16string_view name) const
{
    Id const id = slots_[slotOf(folder, name)];
    return id == root ? std::nullopt : std::optional(id);
}

Index::Place Index::find(std::u16string_view path, LastLink lastLink) const
{
    Walk state;
    auto const id = walk(root, path, lastLink, Above::IsTheRoot, state);
    return {id, state.isLoop};
}

Index::Place Index::follow(Id link) const
{
    Walk state;
    auto const id = followOnce(link, state);
    return {id, state.isLoop};
}

std::optional<Index::Id> Index::walk(Id from, std::u16string_view path, LastLink lastLink, Above above,
                                     Walk& state) const
{
    Id current = from;
    for (std::u16string_view name = takeName(path); !name.empty(); name = takeName(path)) {
        if (at(current).kind != EntryKind::Folder)
            return std::nullopt;
        if (name == u".")
            continue;
        if (name == u"..") {
            if (current == root && above == Above::IsOutside)
                return std::nullopt;
            current = at(current).parent;
            continue;
        }
        auto found = child(current, name);
        bool const isLast = path.find_first_not_of(u'/') == std::u16string_view::npos;
        if (found && at(*found).kind == EntryKind::SymbolicLink && (!isLast || lastLink == LastLink::Follow))
            found = followOnce(*found, state);
        if (!found)
            return std::nullopt;
        current = *found;
    }
    return current;
}

std::optional<Index::Id> Index::followOnce(Id link, Walk& state) const
{
    if (state.linksLeft == 0) {
        state.isLoop = true;
        return std::nullopt;
    }
    --state.linksLeft;
    if (at(link).kind != EntryKind::SymbolicLink || target(link).empty() || target(link).starts_with(u'/'))
        return std::nullopt;
    return walk(at(link).parent, target(link), LastLink::Follow, Above::IsOutside, state);
}

} // namespace foundation::storage::archive::detail
