#pragma once

#include <storage/provider/StorageItem.hpp>
#include <storage/registry/Registry.hpp>
#include <tools/storage/Place.hpp>

#include <boost/property_tree/ptree.hpp>
#include <mutex>
#include <string>
#include <vector>

namespace foundation::storage::tool {

/// Where a place is for whoever reads it, without "." on the way where the store is a local one.
provider::StorageIRI shownLocation(Place const& place);

/// The stores that the tool can reach: those that are built in. They do not wait for disks until they are told to.
class Stores
{
public:
    Stores();

    /// From now on what is committed, copied and moved, and the folders that are made, are on the disk when that is
    /// done.
    void syncAll();

    /// From now on local files are copied with the times of their last change and their extended attributes.
    void keepMetadata();

    registry::Registry const& registry() const { return registry_; }

    /// The item that an argument names: an IRI, or a local path, relative ones taken from the working directory.
    /// Throws `Failure` for what names nothing, for what no store serves, and for a location with a password, which
    /// the failure does not repeat.
    provider::StorageItem openItem(std::string const& argument) const;

    /// The item at a location that was not written by a user.
    provider::StorageItem itemAt(provider::StorageIRI const& location) const { return registry_.open(location); }

    /// Whether a place in an archive was opened.
    bool hasArchives() const;

    /// Has what was changed in archives written into them, the innermost first. Throws `Failure` that names the
    /// archive. What is not written by then is lost with the stores.
    void writeArchives();

    Place open(std::string const& argument) const { return Place(openItem(argument), argument); }

private:
    void keep(provider::StorageItem const& item) const;
    void set(char const* setting, char const* value);

    boost::property_tree::ptree settings_;
    registry::Registry registry_;
    mutable std::mutex mutex_;
    mutable std::vector<provider::StorageItem> kept_; ///< whose stores hold what is not written yet
};

} // namespace foundation::storage::tool
