#pragma once

#include <storage/provider/IProvider.hpp>
#include <storage/provider/StorageItem.hpp>
#include <tools/storage/Place.hpp>

#include <memory>
#include <string>

namespace foundation::storage::tool {

/// The stores that the tool can reach.
class Stores
{
public:
    Stores();

    /// The item that an argument names: an IRI, or a local path, relative ones taken from the working directory.
    /// Throws `Failure` for what names nothing, and for a scheme that no store serves.
    provider::StorageItem openItem(std::string const& argument) const;

    Place open(std::string const& argument) const { return Place(openItem(argument), argument); }

private:
    std::shared_ptr<provider::IProvider> local_;
};

} // namespace foundation::storage::tool
