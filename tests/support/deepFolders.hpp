#pragma once

#include <fcntl.h>
#include <filesystem>
#include <stdexcept>
#include <string>
#include <sys/stat.h>
#include <unistd.h>

namespace foundation::tests::support {

/// Makes folders called `name` in each other, however long the path becomes, and an empty file "file" in the innermost.
inline void makeDeepFolders(std::filesystem::path const& start, int depth, std::string const& name = "d")
{
    int folder = ::open(start.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    for (int level = 0; level < depth && folder >= 0; ++level) {
        ::mkdirat(folder, name.c_str(), 0777);
        int const next = ::openat(folder, name.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
        ::close(folder);
        folder = next;
    }
    int const file = ::openat(folder, "file", O_WRONLY | O_CREAT | O_CLOEXEC, 0666);
    if (::close(file) != 0 || ::close(folder) != 0)
        throw std::runtime_error("cannot make deep folders in " + start.string());
}

} // namespace foundation::tests::support
