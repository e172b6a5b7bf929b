#include <tools/storage/TreeWalk.hpp>

#include <tools/storage/interrupt.hpp>

namespace foundation::storage::tool {

namespace {

void enter(FolderStack& levels, Place const& folder, TreeVisitor& visitor)
{
    levels.enter(folder);
    visitor.enter();
}

void leave(FolderStack& levels, TreeVisitor& visitor)
{
    Place const folder = levels.innermost().folder();
    levels.leave();
    visitor.leave(folder, levels.depth());
}

void step(FolderStack& levels, TreeVisitor& visitor)
{
    FolderLevel& level = levels.innermost();
    if (!level.hasNext())
        return leave(levels, visitor);
    ListedName const listed = level.next();
    Place const place = level.folder().child(listed.name);
    if (visitor.visit(place, listed, levels.depth()))
        enter(levels, place, visitor);
}

} // namespace

void walkTree(Session& session, Place const& folder, Listing kind, TreeVisitor& visitor)
{
    FolderStack levels(kind);
    session.attempt([&] { enter(levels, folder, visitor); });
    while (!levels.empty()) {
        checkInterrupt();
        session.attempt([&] { step(levels, visitor); });
    }
}

} // namespace foundation::storage::tool
