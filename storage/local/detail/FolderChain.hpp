#pragma once

#include <foundation/export.hpp>
#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/NameBuffer.hpp>
#include <storage/local/detail/fileSystem.hpp>

#include <cstddef>
#include <string>
#include <vector>

namespace foundation::storage::local::detail {

/// What a walk does where another file system is mounted on a folder, or a folder of the same one.
enum class Mounts
{
    Enter,
    Refuse,
};

/// The open folders from one folder down to where a walk is.
///
/// A folder is entered by its name in the one above, and never by a link: whatever is renamed, swapped or linked
/// meanwhile, a walk stays in the tree that it began in. Where it goes back to a folder that it had to close, it makes
/// sure that it is the same one. Of a deep tree few folders are open: the outermost, and the last `maximumOpen` that
/// were entered.
///
/// All functions answer 0 or `errno`. Not for several threads at once.
/// Cost: one call to enter a folder, one to leave it. Memory for a name each and for what was read ahead of the open
/// ones.
class FOUNDATION_API FolderChain
{
public:
    static constexpr std::size_t maximumOpen = 64;

    /// Nothing is read of the outermost folder unless it was opened for reading.
    explicit FolderChain(FileDescriptor outermost, std::size_t maximum = maximumOpen);

    /// How many folders have been entered and not left.
    std::size_t depth() const { return levels_.size() - 1; }

    /// The innermost folder, open.
    int folder() const { return levels_.back().descriptor.get(); }

    /// The name by which the innermost folder was entered; empty for the outermost.
    std::string const& name() const { return levels_.back().name; }

    /// The names from the outermost folder to the innermost, separated by '/'.
    std::string path() const { return path(depth()); }

    /// Goes into a folder that lies in the innermost one. What is no folder answers `ENOTDIR` or `ELOOP`; one that
    /// something is mounted on, where that is refused, `EXDEV`.
    [[nodiscard]] int enter(char const* name, Mounts mounts);

    /// Goes back to the folder above. `ESTALE` when somebody has moved it, or a folder on the way to it: then all that
    /// cannot be found again has been left.
    [[nodiscard]] int leave();

    /// After `ESTALE`, the path of the outermost folder that was not found again.
    std::string const& lostPath() const { return lostPath_; }

    /// Goes back to the outermost folder, and to its first entry.
    [[nodiscard]] int restart();

    /// The next name in the innermost folder, or an empty one at its end; it is valid until any other function is
    /// called.
    [[nodiscard]] int read(FoundName& found);

    /// Goes back to the first entry of the innermost folder.
    [[nodiscard]] int rewind();

private:
    struct Identity
    {
        ino64_t inode = 0;
        unsigned major = 0;
        unsigned minor = 0;

        bool operator==(Identity const&) const = default;
    };

    struct Level
    {
        std::string name;
        FileDescriptor descriptor;
        Identity identity = {};           ///< only of one that is closed
        off_t position = 0;               ///< behind the last entry that was taken
        std::vector<char> readAhead = {}; ///< what was read behind it when a walk went deeper
    };

    static int identify(FileDescriptor const& folder, Identity& identity);
    static int openSame(At const& at, Identity const& identity, FileDescriptor& folder);

    bool isInnermostOpen() const { return levels_.size() == 1 || firstOpen_ < levels_.size(); }
    std::string path(std::size_t depth) const;
    int closeOne();
    int open(char const* name, Mounts mounts, FileDescriptor& folder) const;
    int reopenInnermost(int below);
    std::size_t findAgain(FileDescriptor& deepest) const;

    std::size_t maximum_;
    std::vector<Level> levels_;
    std::size_t firstOpen_ = 1; ///< this level and all below it are open, those between it and the outermost are not
    NameBuffer names_;          ///< of the innermost folder
    std::string lostPath_;
};

} // namespace foundation::storage::local::detail
