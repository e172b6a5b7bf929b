#pragma once

#include <foundation/export.hpp>
#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/NameBuffer.hpp>

namespace foundation::storage::local::detail {

/// Reads the names in a folder, a buffer at a time, in the order of the file system, without "." and "..".
///
/// Cost: one call for some hundred names, and the same memory for any number of them.
class FOUNDATION_API FolderReader
{
public:
    explicit FolderReader(FileDescriptor folder);

    /// Where names are looked up.
    FileDescriptor const& folder() const { return folder_; }

    /// The next name, or an empty one at the end. A folder that has been removed has no more names. Answers 0 or
    /// `errno`.
    [[nodiscard]] int next(FoundName& found);

    /// Starts again, with what the folder holds by now. Answers 0 or `errno`.
    [[nodiscard]] int restart();

private:
    FileDescriptor folder_;
    NameBuffer names_;
};

} // namespace foundation::storage::local::detail
