#pragma once

namespace foundation::storage::events {

/// What kind of entry a change event is about.
enum class EntryType
{
    File,
    Folder,
    Unknown, ///< the entry was gone before its kind could be learned
};

} // namespace foundation::storage::events
