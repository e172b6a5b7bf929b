#pragma once

#include <storage/provider/ByteStream.hpp>
#include <tools/storage/OrderedWorkers.hpp>
#include <tools/storage/Place.hpp>
#include <tools/storage/Progress.hpp>
#include <tools/storage/TargetFile.hpp>
#include <tools/storage/kinds.hpp>

#include <boost/date_time/posix_time/posix_time_types.hpp>
#include <cstdint>
#include <optional>

namespace foundation::storage::tool {

struct CopyOptions
{
    Replace replace = Replace::Never;
    bool isInPlace = false; ///< each file is written at its target; otherwise it appears there whole or not at all
    bool isUpdate = false;  ///< what is up to date already is passed over

    /// The time of the last change is kept where the target can, and what else stores keep that copy by themselves once
    /// they are told.
    bool keepsMetadata = false;
};

/// What became of a file.
struct CopiedFile
{
    std::uint64_t size;
    bool wasUpToDate;
};

/// What is known of a target before it is looked at.
enum class TargetState
{
    Unknown,
    Free, ///< nothing stood there a moment ago; should something appear, it is replaced only if that was asked for
};

/// Copies files one by one.
///
/// Threads: any number at once.
class FileCopier
{
public:
    FileCopier(Progress& progress, CopyOptions const& options);

    CopyOptions const& options() const { return options_; }

    /// Throws `Failure` at the source or at the target, whichever it was, and `Interrupted`, also when the context is
    /// asked to stop; the target is then as it was, unless the copy was in place. A source that is a link is copied as
    /// the file that it leads to.
    CopiedFile copy(Place const& source, Place const& target, TargetState state, WorkerContext& context) const;

private:
    /// The store copies by itself: the content does not pass through here.
    std::uint64_t copyInStore(Place const& source, Place const& target, WorkerContext& context) const;
    std::uint64_t transfer(Place const& source, Place const& target, WorkerContext& context) const;
    std::uint64_t copyBytes(Place const& source, provider::ByteStream& input, Place const& target, TargetFile& output,
                            WorkerContext& context) const;

    Progress& progress_;
    CopyOptions options_;
};

/// Gives a copy the time of its source; does nothing where a store cannot, or the source has none. Throws `Failure`.
void keepTime(std::optional<boost::posix_time::ptime> const& time, Place const& copy);

/// Throws `Failure` unless a file may be put at `target`, where `kind` stands: nothing, or a file that may be replaced.
void requireFileTarget(Place const& target, Kind kind, Replace replace);

/// The same, after a look.
void requireFileTarget(Place const& target, Replace replace);

} // namespace foundation::storage::tool
