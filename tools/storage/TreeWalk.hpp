#pragma once

#include <tools/storage/Place.hpp>
#include <tools/storage/Session.hpp>
#include <tools/storage/TreeCursor.hpp>

#include <cstddef>

namespace foundation::storage::tool {

/// What is done on a walk through a tree. What fails with a `Failure` is reported, and the walk goes on.
class TreeVisitor
{
public:
    virtual ~TreeVisitor() = default;

    /// For each entry of the folder where the walk stands. Answers whether to go into it, which must be for folders
    /// alone.
    virtual bool visit(TreeCursor& tree, ListedName const& listed) = 0;

    /// For each folder that can be listed, before its entries and after all below it. The walk stands in it, but for a
    /// folder that was moved away meanwhile, for which nothing is known any more.
    virtual void enter() {}
    virtual void leave([[maybe_unused]] TreeCursor const& tree) {}
    virtual void lose() {}
};

/// Walks through all that is below a folder, depth first and in the order of the store. Memory grows with the depth
/// alone, as with `TreeCursor`.
void walkTree(Session& session, Place const& folder, Listing listing, TreeVisitor& visitor);

} // namespace foundation::storage::tool
