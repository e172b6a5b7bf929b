#pragma once

#include <foundation/export.hpp>

#include <cstddef>
#include <cstdint>
#include <limits>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace foundation::storage::archive::detail {

enum class EntryKind : std::uint8_t
{
    Folder,
    File,
    SymbolicLink,
    HardLink, ///< in a finished index one whose file is not in the archive
    Special,
};

/// One entry; folders hold their entries in the order of the archive.
struct Node
{
    static constexpr std::uint32_t none = std::numeric_limits<std::uint32_t>::max();
    static constexpr std::uint64_t noLocator = std::numeric_limits<std::uint64_t>::max();

    std::uint64_t size = 0;    ///< bytes of content
    std::int64_t modified = 0; ///< microseconds since 1970, UTC

    /// Where the archive has the content, as its format counts. A folder that only paths name has none.
    std::uint64_t locator = noLocator;

    std::uint32_t parent = 0;
    std::uint32_t firstChild = none;
    std::uint32_t lastChild = none;
    std::uint32_t nextSibling = none;
    std::uint32_t nameBegin = 0;
    std::uint32_t nameSize = 0;
    std::uint32_t target = none; ///< of links
    EntryKind kind = EntryKind::Folder;
};

/// The tree of an archive, complete and unchanging.
///
/// Names are safe: none is empty, "." or "..", and none holds '/' or U+0000. Links are followed within the tree and
/// nowhere else.
/// Threads: any number at once.
/// Cost: some 70 bytes for an entry, beside two for each UTF-16 unit of its name. A lookup takes the same time in
/// folders of any size.
class FOUNDATION_API Index
{
public:
    using Id = std::uint32_t;

    static constexpr Id root = 0;

    /// How many links in a row are followed before they count as a loop.
    static constexpr unsigned longestLinkChain = 40;

    enum class LastLink
    {
        Follow,
        Keep,
    };

    /// What a path leads to.
    struct Place
    {
        std::optional<Id> id; ///< nothing where nothing is
        bool isLoop = false;  ///< links lead to links without end
    };

    Node const& at(Id id) const { return nodes_[id]; }
    std::u16string_view name(Id id) const { return nameOf(nodes_[id]); }

    /// Where a link leads to, as the archive says it.
    std::u16string const& target(Id id) const { return targets_[nodes_[id].target]; }

    /// How many entries there are, the root included.
    std::size_t size() const { return nodes_.size(); }

    std::optional<Id> child(Id folder, std::u16string_view name) const;

    /// Follows a path from the root as POSIX does: "." and ".." mean something in folders only, ".." of the root is the
    /// root. A link that points out of the tree leads nowhere.
    Place find(std::u16string_view path, LastLink lastLink) const;

    /// Where the link itself leads, over as many links as it takes.
    Place follow(Id link) const;

private:
    friend class IndexBuilder;
    friend class PendingTree;

    struct Walk
    {
        unsigned linksLeft = longestLinkChain;
        bool isLoop = false;
    };

    enum class Above
    {
        IsTheRoot,
        IsOutside,
    };

    std::u16string_view nameOf(Node const& node) const
    {
        return std::u16string_view(names_).substr(node.nameBegin, node.nameSize);
    }

    std::optional<Id> walk(Id from, std::u16string_view path, LastLink lastLink, Above above, Walk& state) const;
    std::optional<Id> followOnce(Id link, Walk& state) const;
    std::uint64_t hash(Id folder, std::u16string_view name) const;
    std::size_t slotOf(Id folder, std::u16string_view name) const;

    std::vector<Node> nodes_;
    std::u16string names_;
    std::vector<std::u16string> targets_;

    /// Open addressing by folder and name; a root stands for an empty slot, since it is in no folder.
    std::vector<Id> slots_;
    std::uint64_t seed_ = 0;
};

} // namespace foundation::storage::archive::detail
