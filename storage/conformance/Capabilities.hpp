#pragma once

#include <boost/date_time/posix_time/posix_time_types.hpp>

#include <chrono>
#include <cstddef>
#include <optional>
#include <set>
#include <string>

namespace foundation::storage::conformance {

/// What a listing makes of a pattern. A character is a code point.
enum class Patterns
{
    Ignored, ///< it lists everything
    Globs,   ///< `*` is any run of characters, `?` any one, `[a-z]` and `[!a-z]` one of a set; the whole name matches
};

/// What becomes of a file that is copied onto itself by the plain, not atomic, copy.
enum class CopyOntoItself
{
    EndsEmpty, ///< as the copy that every provider inherits leaves it
    ChangesNothing,
};

/// What a provider can do beyond what every provider must. The kit checks each claim in both directions: what is
/// claimed works, what is not claimed is refused and changes nothing.
///
/// The values a harness leaves alone are those of a provider that overrides nothing but the pure operations, over a
/// store that tells all names apart.
struct Capabilities
{
    /// Without it the provider is read-only, and the kit checks reading, listing and the refusals.
    bool writable = true;

    bool recursiveRemoval = false;
    bool recursiveListing = false;
    bool atomicCopy = false;
    CopyOntoItself copyOntoItself = CopyOntoItself::EndsEmpty;
    Patterns patterns = Patterns::Ignored;

    /// The step in which `setLastModified` keeps times; nothing where it is refused.
    std::optional<boost::posix_time::time_duration> settableTimes = {};

    /// Whether `setWritable` works, and whether a file made unwritable then refuses to be opened for writing (it does
    /// not, for example, for the superuser of a POSIX system).
    bool settableWritability = false;
    bool enforcedWritability = false;

    bool fileEvents = false;
    bool folderEvents = false;

    /// How long after a change its event may come. A check that succeeds waits no longer than the event does.
    std::chrono::milliseconds longestEventDelay = std::chrono::seconds(10);

    /// Those that every file has.
    std::set<std::string> extendedAttributes = {};

    /// Whether "." and ".." on a path mean what they mean to POSIX; else they name nothing.
    bool resolvesDots = true;

    /// Whether the topmost location of the store belongs to what the provider serves. Where that is only what lies
    /// beneath some folder, the top is refused with `PermissionDenied`.
    bool servesTop = true;

    bool caseSensitive = true;
    bool casePreserving = true;

    /// Whether names that differ in Unicode normalisation alone are two names.
    bool normalisationSensitive = true;

    /// In UTF-8; nothing where names have no limit.
    std::optional<std::size_t> longestName = {};

    /// Names that the store cannot hold; the provider refuses to create them with `InvalidLocation`.
    std::set<std::u16string> refusedNames = {};

    /// Any number of threads may use one provider at once.
    bool concurrentUse = true;
};

} // namespace foundation::storage::conformance
