#pragma once

#include <storage/local/detail/FileDescriptor.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>

#include <string>
#include <sys/types.h>
#include <vector>

namespace foundation::tests::support {

/// One thing that a provider did to the disk, or that a test noted between.
struct DiskEvent
{
    enum class Kind
    {
        Create,
        CreateNameless, ///< a file that no name leads to
        Write,          ///< to `content`, all that the file holds after it
        Rename,         ///< from `name` in `folder` to `toName` in `toFolder`
        Link,           ///< the same, and the old name stays
        Unlink,
        Sync,    ///< of a file or a folder
        SyncAll, ///< of the file system
        Note,
    };

    Kind kind;
    ino_t folder = 0; ///< that holds `name`
    std::string name = {};
    ino_t file = 0; ///< what was made, written, moved or synced
    ino_t toFolder = 0;
    std::string toName = {};
    std::string content = {}; ///< what the file holds, or what was noted
};

/// As "rename scratch to file"; scratch files are called "scratch".
std::string describe(DiskEvent const& event);

/// Keeps what a provider does to the disk, in order, for as long as this lives. The calls take place.
///
/// Threads: one. For files that fit into memory.
class RecordedSystemCalls
{
public:
    RecordedSystemCalls();
    ~RecordedSystemCalls();

    /// Calls that a test replaces by its own are not recorded.
    storage::local::detail::SystemCalls* operator->() { return calls_.operator->(); }

    void note(std::string const& text);

    std::vector<DiskEvent> const& events() const { return events_; }

    /// All of them in words.
    std::vector<std::string> told() const;

    /// The names of all calls that succeeded or failed, also those that change nothing.
    std::vector<std::string> const& calls() const { return names_; }

    void clear();

    void add(DiskEvent event) { events_.push_back(std::move(event)); }
    void keep(int descriptor) { kept_.emplace_back(descriptor); }
    void count(char const* name) { names_.emplace_back(name); }

private:
    std::vector<DiskEvent> events_;
    std::vector<std::string> names_;
    std::vector<storage::local::detail::FileDescriptor> kept_; ///< or the numbers could come to mean other files
    ReplacedSystemCalls calls_;
};

} // namespace foundation::tests::support
