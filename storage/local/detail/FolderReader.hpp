#pragma once

#include <foundation/export.hpp>
#include <storage/local/detail/FileDescriptor.hpp>

#include <cstddef>
#include <dirent.h>
#include <memory>
#include <string_view>

namespace foundation::storage::local::detail {

/// A name in a folder, and what the folder tells of it.
struct FoundName
{
    /// Ends with a NUL behind; lives as long as nothing more is read.
    std::string_view name;
    unsigned char type;

    /// A link may lead anywhere, and not every file system tells.
    bool isDecided() const { return type != DT_LNK && type != DT_UNKNOWN; }
    bool isFolder() const { return type == DT_DIR; }
};

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
    int refill();

    FileDescriptor folder_;
    std::unique_ptr<char[]> buffer_;
    std::size_t position_ = 0;
    std::size_t end_ = 0;
};

} // namespace foundation::storage::local::detail
