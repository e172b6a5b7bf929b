#pragma once

#include <storage/conformance/Capabilities.hpp>
#include <storage/provider/IProvider.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <functional>
#include <map>
#include <memory>
#include <string>

namespace foundation::storage::conformance {

/// The files below a folder: content by path. Paths are relative and separated by '/'; that of a folder ends in '/' and
/// has no content. Folders are named before what they hold.
using Tree = std::map<std::u16string, std::string>;

/// A folder of the store under test that belongs to one check alone.
struct Place
{
    std::shared_ptr<provider::IProvider> provider;
    provider::StorageIRI folder;

    /// What has to live as long as the place; it goes after the provider, and takes the place with it.
    std::shared_ptr<void> owner = {};
};

/// Makes, round the provider, what its interface cannot make. Leave empty what the store does not have.
struct Makers
{
    using LinkMaker = std::function<void(provider::StorageIRI const& link, provider::StorageIRI const& target)>;

    LinkMaker symbolicLink = {};
    LinkMaker secondName = {}; ///< another name of the same file, equal in rank to the first
    std::function<void(provider::StorageIRI const& path)> specialFile = {};
};

/// All that the kit needs to know of a provider.
struct Harness
{
    /// Makes a new place that holds nothing; not needed of a provider that is read-only.
    std::function<Place()> makePlace = {};

    Capabilities capabilities = {};
    Makers makers = {};

    /// Makes a new place that holds `content`, for a provider that is read-only; others need not have it.
    std::function<Place(Tree const& content)> makeFilledPlace = {};
};

} // namespace foundation::storage::conformance
