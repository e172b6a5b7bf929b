#pragma once

#include <cstddef>
#include <filesystem>

namespace bench {

/// A new folder of empty files below the folder for temporary files, removed at the end of its life.
class Folder
{
public:
    explicit Folder(std::size_t count);
    Folder(Folder const&) = delete;
    Folder& operator=(Folder const&) = delete;
    ~Folder();

    std::filesystem::path const& path() const { return path_; }
    std::size_t lengthOfNames() const { return lengthOfNames_; }

private:
    std::filesystem::path path_;
    std::size_t lengthOfNames_ = 0;
};

} // namespace bench
