#pragma once

namespace foundation::storage::events {

/// What happened to a watched file or folder.
enum class Kind
{
    Created,
    Removed,
    Modified,          ///< the content changed
    AttributesChanged, ///< times, permissions or other metadata changed
    Moved,             ///< renamed; the event names the old and the new location
};

} // namespace foundation::storage::events
