#pragma once

#include <foundation/export.hpp>
#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/Settings.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/provider/ReplacementPolicy.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <optional>
#include <string>

namespace foundation::storage::local::detail {

/// Whose permissions the content has that replaces a file.
enum class Permissions
{
    OfTarget,
    Own, ///< those that the scratch file was made with, or given since
};

/// A file that is written beside its target, and takes the target's place whole or not at all.
///
/// The folders of both are opened at the start and everything happens in them: a folder that is renamed or swapped for
/// a link meanwhile changes nothing. Who replaces a file that others may not read need not fear that they read the
/// scratch file: it never has permissions that the file lacks.
///
/// One with a name of its own choice that replaces no file, and need not survive a power failure, has no name at all
/// until the commit, where the file system can do that: it takes less time, and nothing is left of it when this process
/// is killed.
///
/// Errors: `Exception`, and `DurabilityException` from `commit`.
/// Ownership: refers to the root, which must outlive it. Removes the scratch file at the end of its life unless that
/// took the target's place.
/// Threads: one at a time.
/// Cost: three descriptors at most, for a moment one more; beside the writing eight calls for a commit that replaces a
/// file under `Durability::Full`, two of which wait for the disk.
class FOUNDATION_API ScratchFile
{
public:
    /// Makes a scratch file of a new name. `flags` are `O_WRONLY` or `O_RDWR`, and `O_APPEND` if wanted; a file that
    /// replaces none gets `mode` less the umask. Failures name the target.
    ScratchFile(Root const& root, provider::StorageIRI const& target, Durability durability, int flags = O_WRONLY,
                mode_t mode = newFileMode, Permissions permissions = Permissions::OfTarget);

    /// Makes the scratch file at a location of the caller's choice, which may be in another folder of the same file
    /// system. One that stands there already is written into, as `O_TRUNC` says; without `O_CREAT` in `flags` one must.
    /// Failures to open it name the scratch file.
    ScratchFile(Root const& root, provider::StorageIRI const& target, provider::StorageIRI const& scratch,
                Durability durability, int flags);

    ScratchFile(ScratchFile const&) = delete;
    ScratchFile& operator=(ScratchFile const&) = delete;
    ~ScratchFile();

    /// Open until `commit` or `discard` succeeds.
    FileDescriptor const& file() const { return file_; }

    std::string const& targetPath() const { return path_; }

    /// Puts the file in the target's place, as durably as was asked for.
    ///
    /// `Overwrite` and `Clobber` replace a file or a link; the new content has the permission bits of the old, those of
    /// the file that a link led to, unless it was to keep its own. `Preserve` and `NoClobber` replace nothing.
    ///
    /// Errors: `ResourceAlreadyExists` naming the target for what must not be replaced, a folder always. After a
    /// failure it can be called again, or `discard`, with one exception: when the content could not be written to the
    /// disk, every further call fails in the same way, because the system reports such a loss once and a second sync
    /// would succeed without the data. `DurabilityException` when the target has been replaced and the sync of the
    /// folder failed: a further call repeats that alone.
    void commit(provider::ReplacementPolicy policy);

    /// Removes the scratch file; nothing where it took the target's place already.
    void discard();

private:
    enum class State
    {
        Writing,
        InPlace, ///< seen by everybody, and not yet known to be on the disk
        Done
    };

    bool isNameless() const { return scratchName_.empty(); }

    void openFolders(std::string const& scratchPath);
    bool openNameless(int flags, mode_t mode);
    void openScratch(int flags);
    int openExisting(int flags);
    std::optional<mode_t> modeOfTarget() const;
    int findTarget(Status& status) const;

    void keepPermissions();
    void setPermissions(mode_t mode);
    int closeDuplicate();
    void writeContentBack();
    void putInPlace(provider::ReplacementPolicy policy);
    int moveInPlace(provider::ReplacementPolicy policy);
    int nameInPlace(provider::ReplacementPolicy policy);
    int giveScratchName();
    int copyToNamed();
    int copyAll(FileDescriptor const& to) const;
    int syncFolder();
    void finish();

    At targetAt() const { return {folder_.get(), name_.c_str()}; }
    At scratchAt() const;

    Root const& root_;
    provider::StorageIRI const target_;
    provider::StorageIRI const scratch_; ///< the location that failures name; the target where the name is our own
    std::string const path_;
    std::string const name_;
    std::string scratchName_; ///< empty while it has none
    FileDescriptor folder_;
    FileDescriptor scratchFolder_; ///< open only where it is another one
    FileDescriptor file_;
    Durability const durability_;
    Permissions const permissions_ = Permissions::OfTarget;
    bool isFolderReadable_ = false;
    int lost_ = 0; ///< the `errno` of content that did not get to the disk
    State state_ = State::Writing;
};

} // namespace foundation::storage::local::detail
