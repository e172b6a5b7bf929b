#pragma once

#include <tools/storage/FolderStack.hpp>
#include <tools/storage/Session.hpp>

#include <functional>
#include <optional>

namespace foundation::storage::tool {

/// Removes folders with all they hold, and never what a link leads to.
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
    void removeEntry(FolderLevel& level, ListedName const& entry);
    bool leavesEntries(FolderLevel const& level);
    void leaveFolder();
    void noteFailure();

    Session& session_;
    Check check_;
    FolderStack levels_;
};

} // namespace foundation::storage::tool
