#pragma once

#include <foundation/export.hpp>

#include <cstddef>
#include <dirent.h>
#include <memory>
#include <string_view>
#include <vector>

namespace foundation::storage::local::detail {

/// A name in a folder, and what the folder tells of it.
struct FoundName
{
    /// Ends with a NUL behind; lives as long as nothing more is read.
    std::string_view name = {};
    unsigned char type = DT_UNKNOWN;
    ino64_t inode = 0;
    off64_t end = 0; ///< where the folder is read on behind it

    /// A link may lead anywhere, and not every file system tells.
    bool isDecided() const { return type != DT_LNK && type != DT_UNKNOWN; }
    bool isFolder() const { return type == DT_DIR; }
};

/// The names that one call has read from a folder, without "." and "..".
class FOUNDATION_API NameBuffer
{
public:
    NameBuffer();

    /// The next name of an open folder, or an empty one at its end. A folder that has been removed has no more names.
    /// Answers 0 or `errno`.
    [[nodiscard]] int next(int folder, FoundName& found);

    /// Forgets what was read, for another folder or another place in this one.
    void clear();

    /// Hands out what was read and has not been given, and takes it back.
    std::vector<char> takeRest();
    void putRest(std::vector<char> const& rest);

private:
    int refill(int folder);

    std::unique_ptr<char[]> buffer_;
    std::size_t position_ = 0;
    std::size_t end_ = 0;
};

} // namespace foundation::storage::local::detail
