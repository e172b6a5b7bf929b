#pragma once

#include <tools/storage/FileCopier.hpp>
#include <tools/storage/FolderStack.hpp>
#include <tools/storage/Session.hpp>
#include <tools/storage/kinds.hpp>

namespace foundation::storage::tool {

/// What becomes of a link to a file.
enum class FileLinks
{
    Copy,   ///< the file that it leads to is copied
    Refuse, ///< it is complained about
};

/// Copies folders with all they hold, depth first and in the order of the listings.
///
/// Links to folders, broken links and special files are complained about and passed over, and links are never followed
/// below the target either. An existing folder is merged with.
class TreeCopier
{
public:
    TreeCopier(Session& session, FileCopier& files, FileLinks links);

    /// Complains about what cannot be copied and does the rest; answers whether everything was copied.
    bool copy(Place const& source, Place const& target);

private:
    void step();
    void copyEntry(Place const& source, Place const& target);
    void enter(Place const& source, Place const& target);

    Session& session_;
    FileCopier& files_;
    FileLinks links_;
    FolderStack levels_;
    bool isComplete_ = true;
};

/// What stands at `source`. Throws `Failure` for what is never copied: links to folders, broken links, special files.
Kind requireCopyable(Place const& source);

} // namespace foundation::storage::tool
