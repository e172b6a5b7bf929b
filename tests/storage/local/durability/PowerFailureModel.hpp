#pragma once

#include <storage/local/detail/FileDescriptor.hpp>
#include <tests/storage/local/RecordedSystemCalls.hpp>

#include <filesystem>
#include <functional>
#include <map>
#include <set>
#include <string>
#include <vector>

namespace foundation::tests::support {

/// What may be found on a disk after a power failure that cuts a record of events short.
///
/// The disk promises what POSIX does, and nothing more. Content is there once its file was synced; until then it may be
/// what it was at the last sync, nothing, rubbish, or all that was written. A name is made, changed or gone once its
/// folder was synced; until then each change may have happened or not, whatever happened to those before it. A rename
/// happens in one step unless one of its two folders was synced and the other was not.
class PowerFailureModel
{
public:
    /// What is found: content, by the name of a folder and the name of what is in it. Folders have no content.
    using Outcome = std::map<std::string, std::map<std::string, std::string>>;
    using Check = std::function<void(Outcome const&)>;

    static constexpr char const* rubbish = "\xFF rubbish \xFF";

    /// Everything that is in these folders now is on the disk. Before the record begins.
    explicit PowerFailureModel(std::vector<std::filesystem::path> folders);

    /// Calls `check` with everything that may be found when the power fails after the first `count` events.
    void forEachOutcome(std::vector<DiskEvent> const& events, std::size_t count, Check const& check) const;

private:
    struct Change;
    struct Disk;

    void checkContents(Disk const& disk, std::map<ino_t, std::map<std::string, ino_t>> const& names,
                       Check const& check) const;

    std::map<ino_t, std::string> folders_;
    std::map<ino_t, std::map<std::string, ino_t>> names_;
    std::map<ino_t, std::string> contents_;
    std::vector<storage::local::detail::FileDescriptor> kept_; ///< or the numbers could come to mean other files
};

} // namespace foundation::tests::support
