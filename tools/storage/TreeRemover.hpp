#pragma once

#include <storage/provider/StorageIRI.hpp>
#include <tools/storage/FolderStack.hpp>
#include <tools/storage/Session.hpp>

#include <functional>
#include <optional>

namespace foundation::storage::tool {

/// Removes folders with all they hold, and never what a link leads to.
///
/// A store that can remove a whole folder does so. Of a local one it tells what stays; elsewhere what stays is gone
/// through entry by entry, so that each is named.
class TreeRemover
{
public:
    /// Called before a file is removed, with its counterpart; throws `Failure` to keep the file.
    using Check = std::function<void(Place const& file, Place const& counterpart)>;

    explicit TreeRemover(Session& session);

    /// Complains about what cannot be removed and does the rest.
    void remove(Place const& folder);

    /// The same, with a second tree of the same form at `counterpart`.
    void remove(Place const& folder, Place const& counterpart, Check check);

private:
    void walk(Place const& folder, std::optional<Place> counterpart);
    void step();
    void removeLocal(Place const& folder);
    bool removesWhole(Place const& folder);
    void removeEntry(FolderLevel& level, ListedName const& entry);
    bool leavesEntries(FolderLevel const& level);
    void leaveFolder();
    void noteFailure();

    Session& session_;
    Check check_;
    FolderStack levels_;
    std::optional<provider::StorageIRI> stays_; ///< what the store last failed to remove
};

} // namespace foundation::storage::tool
