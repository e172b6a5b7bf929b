#pragma once

#include <tools/storage/FileCopier.hpp>
#include <tools/storage/FolderEnd.hpp>
#include <tools/storage/OrderedWorkers.hpp>
#include <tools/storage/Place.hpp>
#include <tools/storage/Session.hpp>
#include <tools/storage/TreeCounter.hpp>
#include <tools/storage/kinds.hpp>
#include <tools/storage/transfers.hpp>

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace foundation::storage::tool {

/// What is told of each file, besides failures.
enum class Telling
{
    Nothing,
    Names,
    JSON, ///< one object a line, for failures too
};

/// What becomes of a link to a file.
enum class FileLinks
{
    Copy,   ///< the file that it leads to is copied
    Refuse, ///< it is complained about
};

struct CopyRunOptions
{
    CopyOptions files = {};
    FileLinks links = FileLinks::Copy;
    Telling telling = Telling::Nothing;
    std::size_t jobs = 1;
};

/// A run of copies: does them in a few threads, and tells of each, and of what fails, in the order in which they were
/// asked for.
///
/// Memory does not grow with the number of files. Threads: belongs to the one that made it.
class CopyRun
{
public:
    CopyRun(Session& session, CopyRunOptions const& options);

    /// Tells beforehand all that will be copied, folders too, so that progress can tell how much that is.
    void announce(std::vector<Place> sources);

    /// Has the file at `source` copied, sooner or later. Throws `Interrupted`.
    void copyFile(Place source, Place target, TargetState state);

    /// Gives the copy of a folder what it has of its source, when all that was asked for before is done; `isNew` says
    /// that the copy was made by this run. Throws `Interrupted`.
    void finishFolder(Place source, Place target, bool isNew);

    /// What is copied from now on is of another folder than what was copied before.
    void changeFolder() { workers_.beginGroup(); }

    /// Has a failure complained about when its turn has come. Throws `Interrupted`.
    void fail(Place const& source, Place const& target, Failure const& failure);

    /// The same, for when it is not known where the source goes, or for an argument that names nothing.
    void fail(Place const& source, Failure const& failure);
    void fail(Failure const& failure);

    /// Waits for all copies that were asked for. Throws `Interrupted`.
    void settle() { workers_.finish(); }

    /// The same. Answers whether all that was asked for since the last call was done. Throws `Interrupted`.
    bool finish();

    /// Stops the copies, tells of those that were done, and answers what to say of them: "120 of 400 files copied, 1.2
    /// GiB", with the number of all files if `isAll` were asked for.
    std::string stop(bool isAll);

    /// To be called again and again by who does long work beside the copies: tells how far all is. Throws
    /// `Interrupted`.
    void lookAround();

private:
    /// In a thread of its own.
    OrderedWorkers::Report copy(Place const& source, Place const& target, TargetState state, WorkerContext& context);
    OrderedWorkers::Report reportOf(Failure failure, Transfer const& transfer);

    void report(FolderEnd const& end);
    void record(CopiedFile const& file, std::string const& line);
    void tell(std::string const& line);

    Session& session_;
    CopyRunOptions options_;
    FileCopier files_;
    std::uint64_t asked_ = 0;
    std::uint64_t copied_ = 0;
    std::uint64_t upToDate_ = 0;
    std::uint64_t bytes_ = 0;
    bool isComplete_ = true;
    std::vector<Place> announced_;
    std::optional<TreeCounter> counter_;
    OrderedWorkers workers_;
};

/// What stands at `source`. Throws `Failure` for what is never copied: links to folders, broken links, special files.
Kind requireCopyable(Place const& source);

} // namespace foundation::storage::tool
