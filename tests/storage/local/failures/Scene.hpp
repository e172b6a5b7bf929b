#pragma once

#include <storage/local/LocalProvider.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <map>
#include <string>

namespace foundation::tests::support {

/// What a folder holds: permission bits and content of each file by its path, "/" for a folder, and what each link
/// says.
using Tree = std::map<std::string, std::string>;

/// A folder "from" with something of every kind, and a folder "to", so that a path tells the end of an operation that
/// it belongs to; and a provider of both.
class Scene
{
public:
    /// A confined provider reaches nothing else.
    explicit Scene(bool confined);

    storage::local::LocalProvider const& provider() const { return provider_; }
    TemporaryFolder const& folder() const { return folder_; }
    storage::provider::StorageIRI at(std::u16string const& name) const { return folder_.iri(name); }

    Tree tree() const;

private:
    TemporaryFolder folder_;
    storage::local::LocalProvider provider_;
};

/// More than one buffer, and no whole number of pages.
std::string const& longContent();

/// How many descriptors this process has open.
std::size_t openDescriptors();

/// Whether a name is one that writers give to what they have not finished.
bool isScratch(std::string const& path);

} // namespace foundation::tests::support
