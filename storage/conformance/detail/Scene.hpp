#pragma once

#include <storage/conformance/Harness.hpp>
#include <storage/provider/ErrorCode.hpp>
#include <storage/provider/StorageItem.hpp>

#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <string_view>

namespace foundation::storage::conformance::detail {

/// The place in which one check happens, with the content that the check starts from.
///
/// Its end reports scratch files that were left in it.
class Scene
{
public:
    explicit Scene(Harness const& harness, Tree const& content = {});
    ~Scene();
    Scene(Scene const&) = delete;
    Scene& operator=(Scene const&) = delete;

    Harness const& harness() const { return harness_; }
    Capabilities const& capabilities() const { return harness_.capabilities; }

    std::shared_ptr<provider::IProvider> const& shared() const { return place_.provider; }
    provider::IProvider& provider() const { return *place_.provider; }

    provider::StorageIRI const& iri() const { return place_.folder; }
    provider::StorageIRI iri(std::u16string const& path) const { return {place_.folder, path}; }
    provider::StorageItem item() const { return {place_.provider, place_.folder}; }
    provider::StorageItem item(std::u16string const& path) const { return {place_.provider, iri(path)}; }

    void write(std::u16string const& path, std::string_view content) const;
    std::string read(std::u16string const& path) const;
    Tree tree() const;

    /// Whether this is all that the place holds.
    testing::AssertionResult holds(Tree const& expected) const;

    /// Whether `action` throws `Exception` with this code and location, and changes nothing.
    testing::AssertionResult refuses(std::function<void()> const& action, provider::ErrorCode code,
                                     provider::StorageIRI const& location) const;

private:
    Harness const& harness_;
    Place place_;
};

/// Whether `action` throws `Exception` with this code and location.
testing::AssertionResult fails(std::function<void()> const& action, provider::ErrorCode code,
                               provider::StorageIRI const& location);

} // namespace foundation::storage::conformance::detail
