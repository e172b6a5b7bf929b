#include <tools/storage/TreeCopier.hpp>

#include <tools/storage/FolderEnd.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/scratchName.hpp>

#include <utility>

namespace foundation::storage::tool {

namespace {

/// Answers whether it was made; an existing one will do.
bool makeFolder(Place const& target)
{
    Kind const kind = kindOf(target);
    switch (kind) {
    case Kind::None:
        at(target, [&] { target.item().createFolder(); });
        break;
    case Kind::RegularFolder:
        break;
    case Kind::SymlinkToFolder:
        throw Failure{target.text(), "a link to a folder, not followed"};
    case Kind::RegularFile:
    case Kind::SpecialFile:
    case Kind::SymlinkToFile:
    case Kind::BrokenSymlink:
        throw Failure{target.text(), "not a folder, and a folder never replaces it"};
    }
    return kind == Kind::None;
}

} // namespace

TreeCopier::TreeCopier(CopyRun& run) : run_(run) {}

void TreeCopier::copy(Place const& source, Place const& target)
{
    for (enter(source, target); !levels_.empty(); step())
        checkInterrupt();
}

/// A listing that fails is through.
void TreeCopier::step()
{
    FolderLevel& level = levels_.innermost();
    try {
        if (level.hasNext())
            return copyEntry(level, level.next());
    } catch (Failure const& failure) {
        run_.fail(level.folder(), level.counterpart(), failure);
        return;
    }
    run_.finishFolder(level.folder(), level.counterpart(), level.isFresh);
    levels_.leave();
    run_.changeFolder();
}

/// What a listing calls a folder may be a link to one. What somebody is still writing is nobody else's.
void TreeCopier::copyEntry(FolderLevel const& level, ListedName const& entry)
{
    if (entry.isFile && isScratchName(entry.name))
        return;
    Place source = level.folder().child(entry.name);
    Place target = level.counterpart().child(entry.name);
    if (entry.isFile)
        run_.copyFile(std::move(source), std::move(target), level.isFresh ? TargetState::Free : TargetState::Unknown);
    else
        enter(source, target);
}

/// Opens the source before the target is made, so that nothing is left of a folder that cannot be read.
void TreeCopier::enter(Place const& source, Place const& target)
{
    std::size_t const depth = levels_.depth();
    try {
        requireCopyable(source);
        levels_.enter(source, target);
        levels_.innermost().isFresh = makeFolder(target);
        if (levels_.innermost().isFresh)
            beginFolder(source, target);
        run_.changeFolder();
    } catch (Failure const& failure) {
        if (levels_.depth() > depth)
            levels_.leave();
        run_.fail(source, target, failure);
    }
}

} // namespace foundation::storage::tool
