#include <tools/storage/TreeRemover.hpp>

#include <storage/local/folderRemoval.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/ExtendedFeature.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/kinds.hpp>
#include <tools/storage/leaveBehind.hpp>
#include <tools/storage/physicalPath.hpp>

#include <memory>
#include <utility>
#include <vector>

namespace foundation::storage::tool {

TreeRemover::TreeRemover(Session& session) : session_(session) {}

void TreeRemover::remove(Place const& folder)
{
    check_ = nullptr;
    if (isLocal(folder))
        removeLocal(folder);
    else if (!removesWhole(folder))
        walk(folder, std::nullopt);
}

/// A walk along paths could be led elsewhere by whoever swaps folders for links meanwhile.
void TreeRemover::removeLocal(Place const& folder)
{
    auto const staying = std::make_shared<std::vector<local::StayingEntry>>();
    at(folder, [&] {
        doOrLeaveBehind([staying, location = folder.item().getLocation()] {
            *staying = local::removeFolderAsFarAsPossible(location);
        });
    });
    for (local::StayingEntry const& entry : *staying) {
        Place const place = entry.path.empty() ? folder : folder.child(entry.path);
        session_.complain({place.text(), describe(entry.reason)});
    }
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

/// Lets the store remove a folder; answers whether it is gone. What the store went through to get at what stays is not
/// tried again; a folder that stays itself is not entered, for something may be mounted on it.
bool TreeRemover::removesWhole(Place const& folder)
{
    provider::StorageItem const& item = folder.item();
    if (!item.hasFeature(provider::ExtendedFeature::RecursiveFolderRemoval))
        return false;
    if (stays_ && item.getLocation().isAncestorOf(*stays_))
        return false;
    try {
        doOrLeaveBehind([item] { item.removeFolderRecursively(); });
        return true;
    } catch (provider::Exception const& error) {
        stays_ = error.getStorageIRI();
        if (*stays_ == item.getLocation())
            rethrowAsFailure(folder);
    } catch (std::exception const&) {
        rethrowAsFailure(folder);
    }
    return false;
}

/// What a listing calls a folder may be a link to one.
void TreeRemover::removeEntry(FolderLevel& level, ListedName const& entry)
{
    Place const child = level.folder().child(entry.name);
    std::optional<Place> counterpart;
    if (check_)
        counterpart = level.counterpart().child(entry.name);
    if (!entry.isFile && kindOf(child) == Kind::RegularFolder) {
        if (!check_ && removesWhole(child))
            level.hasChanged = true;
        else
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
