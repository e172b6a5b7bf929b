#pragma once

#include <storage/conformance/Harness.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/provider/IProvider.hpp>

#include <array>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace foundation::storage::conformance::detail {

/// One of the eight listing operations; each takes a pattern or none.
struct ListingOperation
{
    char const* name;
    provider::IProvider::Listing (provider::IProvider::*list)(provider::StorageIRI const&, std::u16string) const;
    bool files;
    bool folders;
    bool attributes; ///< every entry has to have them
    bool recursive;
};

extern std::array<ListingOperation, 8> const listingOperations;

/// Calls `function` with each operation that is recursive, or with each that is not.
template <typename Function>
void forEachListing(bool recursive, Function const& function)
{
    for (ListingOperation const& operation : listingOperations) {
        if (operation.recursive == recursive) {
            SCOPED_TRACE(operation.name);
            function(operation);
        }
    }
}

using Names = std::vector<std::u16string>;

/// The content of a place in which every operation finds something, and something to leave out.
Tree const& listingContent();

/// What an operation has to list of `listingContent`: of its kind, what `wanted` lets through by its last name.
Names expectedNames(ListingOperation const& operation, std::function<bool(std::u16string_view)> const& wanted);
Names expectedNames(ListingOperation const& operation);

provider::IProvider::Listing list(Scene const& scene, ListingOperation const& operation,
                                  provider::StorageIRI const& folder, std::u16string const& pattern = {});

/// The names of a listing in order of code units, those of folders followed by '/'.
Names namesOf(provider::IProvider::Listing const& listing);

} // namespace foundation::storage::conformance::detail
