#pragma once

#include <storage/local/FolderWalk.hpp>
#include <tools/storage/FolderStack.hpp>
#include <tools/storage/Place.hpp>
#include <tools/storage/Stores.hpp>
#include <tools/storage/kinds.hpp>

#include <cstddef>
#include <memory>
#include <optional>
#include <string>

namespace foundation::storage::tool {

/// A walk through a folder and what lies below it, led by its user, in the order of the store.
///
/// Through local folders it goes from open folder to open folder, so that nobody who swaps folders for links meanwhile
/// leads it elsewhere, and in trees of any depth memory grows by a name for each level.
/// All but the constructor throws `Failure`.
class TreeCursor
{
public:
    virtual ~TreeCursor() = default;

    /// The next entry of the innermost folder; nothing at its end. A folder that fails is through.
    virtual std::optional<ListedName> next() = 0;

    /// Goes into a folder that was listed. Answers false where that has gone, or become something else.
    virtual bool enter(ListedName const& listed) = 0;

    /// Goes back to the folder above, or further, with a failure, where folders have been moved away.
    virtual void leave() = 0;

    /// How many folders lie above the innermost one; 0 at the start.
    virtual std::size_t depth() const = 0;

    /// What an entry of the innermost folder is, which the listing may know.
    virtual Kind kindOf(ListedName const& listed) = 0;

    /// The innermost folder, and an entry of it, as the user knows them.
    virtual std::string text() const = 0;
    virtual std::string textOf(ListedName const& listed) const = 0;
    virtual Place place() const = 0;
    virtual Place placeOf(ListedName const& listed) const = 0;

    /// The innermost folder, and an entry of it, for working on them: whatever is swapped, their locations lead nowhere
    /// else.
    virtual Place workingPlace() = 0;
    virtual Place workingPlaceOf(ListedName const& listed) = 0;
};

/// A local link to a folder is followed or refused as it is told to. Throws `Failure` when the folder cannot be listed.
std::unique_ptr<TreeCursor> openTree(Stores const& stores, Place const& folder, Listing listing,
                                     local::StartLink link = local::StartLink::Follow);

} // namespace foundation::storage::tool
