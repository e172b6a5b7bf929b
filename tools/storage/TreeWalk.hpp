#pragma once

#include <tools/storage/FolderStack.hpp>
#include <tools/storage/Place.hpp>
#include <tools/storage/Session.hpp>

#include <cstddef>

namespace foundation::storage::tool {

/// What is done on a walk through a tree. What fails with a `Failure` is reported, and the walk goes on.
class TreeVisitor
{
public:
    virtual ~TreeVisitor() = default;

    /// For each entry, of depth 1 in the folder where the walk starts. Answers whether to go into it, which must be for
    /// folders alone.
    virtual bool visit(Place const& place, ListedName const& listed, std::size_t depth) = 0;

    /// For each folder that can be listed, before its entries and after all below it.
    virtual void enter() {}
    virtual void leave([[maybe_unused]] Place const& folder, [[maybe_unused]] std::size_t depth) {}
};

/// Walks through all that is below a folder, depth first and in the order of the store. Memory grows with the depth
/// alone, as with `FolderStack`.
void walkTree(Session& session, Place const& folder, Listing kind, TreeVisitor& visitor);

} // namespace foundation::storage::tool
