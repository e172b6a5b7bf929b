#pragma once

#include <fl/filesystem/native_name.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <stdlib.h>
#include <string>

namespace foundation::tests::support {

/// A new empty folder, removed with all that is in it at the end of its life.
class TemporaryFolder
{
public:
    TemporaryFolder() : TemporaryFolder(std::filesystem::temp_directory_path()) {}

    explicit TemporaryFolder(std::filesystem::path const& parent)
    {
        std::string name = (parent / "foundation-XXXXXX").string();
        if (::mkdtemp(name.data()) == nullptr)
            throw std::runtime_error("cannot make a folder in " + parent.string());
        path_ = name;
    }

    TemporaryFolder(TemporaryFolder const&) = delete;
    TemporaryFolder& operator=(TemporaryFolder const&) = delete;

    ~TemporaryFolder()
    {
        std::error_code ignored;
        std::filesystem::remove_all(path_, ignored);
    }

    std::filesystem::path const& path() const { return path_; }
    std::filesystem::path operator/(std::string const& name) const { return path_ / name; }

    storage::provider::StorageIRI iri() const
    {
        storage::provider::StorageIRI const root(u"file:///");
        return storage::provider::StorageIRI(root, fl::filesystem::from_native_bytes(path_.native()));
    }
    storage::provider::StorageIRI iri(std::u16string const& name) const
    {
        return storage::provider::StorageIRI(iri(), name);
    }

    /// Makes a file with this content, and answers its path.
    std::filesystem::path write(std::string const& name, std::string const& content) const
    {
        std::ofstream file(path_ / name, std::ios::binary);
        if (!(file << content).flush())
            throw std::runtime_error("cannot write " + (path_ / name).string());
        return path_ / name;
    }

    /// The content of a file; throws for one that cannot be read.
    std::string read(std::string const& name) const
    {
        std::ifstream file(path_ / name, std::ios::binary);
        if (!file)
            throw std::runtime_error("cannot read " + (path_ / name).string());
        std::ostringstream content;
        content << file.rdbuf();
        return content.str();
    }

private:
    std::filesystem::path path_;
};

} // namespace foundation::tests::support
