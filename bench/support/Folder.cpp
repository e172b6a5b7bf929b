#include "Folder.hpp"

#include <stdexcept>
#include <stdlib.h>
#include <string>
#include <sys/stat.h>

namespace bench {

Folder::Folder(std::size_t count)
{
    std::string pattern = (std::filesystem::temp_directory_path() / "bench-XXXXXX").string();
    if (::mkdtemp(pattern.data()) == nullptr)
        throw std::runtime_error("cannot make a folder in " + pattern);
    path_ = pattern;
    for (std::size_t i = 0; i != count; ++i) {
        std::string const name = "quarterly-report-" + std::to_string(i) + ".txt";
        if (::mknod((path_ / name).c_str(), S_IFREG | S_IRUSR, 0) != 0)
            throw std::runtime_error("cannot make a file in " + pattern);
        lengthOfNames_ += name.size();
    }
}

Folder::~Folder()
{
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
}

} // namespace bench
