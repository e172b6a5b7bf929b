#include <tools/storage/TreeCopier.hpp>

#include <tools/storage/describe.hpp>
#include <tools/storage/interrupt.hpp>

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

Kind requireCopyable(Place const& source)
{
    Kind const kind = existingKindOf(source);
    switch (kind) {
    case Kind::SymlinkToFolder:
        throw Failure{source.text(), "a link to a folder, not followed"};
    case Kind::BrokenSymlink:
        throw Failure{source.text(), "a broken link, not copied"};
    case Kind::SpecialFile:
        throw Failure{source.text(), "a special file, not copied"};
    case Kind::RegularFile:
    case Kind::SymlinkToFile:
    case Kind::RegularFolder:
    case Kind::None:
        break;
    }
    return kind;
}

TreeCopier::TreeCopier(Session& session, FileCopier& files, FileLinks links)
    : session_(session), files_(files), links_(links)
{}

bool TreeCopier::copy(Place const& source, Place const& target)
{
    isComplete_ = session_.attempt([&] { enter(source, target); });
    while (!levels_.empty()) {
        checkInterrupt();
        isComplete_ &= session_.attempt([&] { step(); });
    }
    return isComplete_;
}

void TreeCopier::step()
{
    FolderLevel& level = levels_.innermost();
    if (!level.hasNext()) {
        levels_.leave();
        return;
    }
    ListedName const entry = level.next();
    copyEntry(level.folder().child(entry.name), level.counterpart().child(entry.name));
}

void TreeCopier::copyEntry(Place const& source, Place const& target)
{
    Kind const kind = requireCopyable(source);
    if (kind == Kind::SymlinkToFile && links_ == FileLinks::Refuse)
        throw Failure{source.text(), "a link, which would become a file"};
    if (kind == Kind::RegularFolder)
        enter(source, target);
    else if (levels_.innermost().isFresh)
        files_.copyToFreeTarget(source, target);
    else
        files_.copy(source, target);
}

/// Opens the source before the target is made, so that nothing is left of a folder that cannot be read.
void TreeCopier::enter(Place const& source, Place const& target)
{
    levels_.enter(source, target);
    try {
        levels_.innermost().isFresh = makeFolder(target);
    } catch (Failure const&) {
        levels_.leave();
        throw;
    }
}

} // namespace foundation::storage::tool
