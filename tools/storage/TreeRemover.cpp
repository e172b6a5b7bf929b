#include <tools/storage/TreeRemover.hpp>

#include <storage/provider/Exception.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/kinds.hpp>

#include <utility>

namespace foundation::storage::tool {

TreeRemover::TreeRemover(Session& session) : session_(session) {}

void TreeRemover::remove(Place const& folder)
{
    check_ = nullptr;
    walk(folder, std::nullopt);
}

void TreeRemover::remove(Place const& folder, Place const& counterpart, Check check)
{
    check_ = std::move(check);
    walk(folder, counterpart);
}

void TreeRemover::walk(Place const& folder, std::optional<Place> counterpart)
{
    session_.attempt([&] { levels_.enter(folder, std::move(counterpart)); });
    while (!levels_.empty()) {
        checkInterrupt();
        if (!session_.attempt([&] { step(); }))
            noteFailure();
    }
}

/// A folder that keeps something is not tried itself: its own complaint would tell nothing new.
void TreeRemover::noteFailure()
{
    if (!levels_.empty())
        levels_.innermost().hasFailed = true;
}

void TreeRemover::step()
{
    FolderLevel& level = levels_.innermost();
    if (level.hasNext())
        removeEntry(level, level.next());
    else if (leavesEntries(level))
        level.restart();
    else
        leaveFolder();
}

/// What a listing calls a folder may be a link to one.
void TreeRemover::removeEntry(FolderLevel& level, ListedName const& entry)
{
    Place const child = level.folder().child(entry.name);
    std::optional<Place> counterpart;
    if (check_)
        counterpart = level.counterpart().child(entry.name);
    if (!entry.isFile && kindOf(child) == Kind::RegularFolder) {
        levels_.enter(child, std::move(counterpart));
        return;
    }
    if (check_)
        check_(child, *counterpart);
    at(child, [&] { child.item().removeFile(); });
    level.hasChanged = true;
    session_.progress().addFile();
}

/// Removes a folder that has been gone through. Answers whether a fresh listing has to be gone through: some stores
/// leave entries out of a listing when others are removed meanwhile.
bool TreeRemover::leavesEntries(FolderLevel const& level)
{
    if (level.hasFailed)
        return false;
    try {
        level.folder().item().removeFolder();
    } catch (provider::Exception const& error) {
        if (error.getErrorCode() == provider::ErrorCode::FolderNotEmpty && level.hasChanged)
            return true;
        rethrowAsFailure(level.folder());
    }
    return false;
}

void TreeRemover::leaveFolder()
{
    bool const hasFailed = levels_.innermost().hasFailed;
    levels_.leave();
    if (levels_.empty())
        return;
    levels_.innermost().hasFailed |= hasFailed;
    levels_.innermost().hasChanged |= !hasFailed;
}

} // namespace foundation::storage::tool
