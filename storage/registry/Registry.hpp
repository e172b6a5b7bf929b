#pragma once

#include <foundation/export.hpp>
#include <storage/provider/ContainerProviderFactory.hpp>
#include <storage/provider/PhysicalProviderFactory.hpp>
#include <storage/provider/StorageIRI.hpp>
#include <storage/provider/StorageItem.hpp>
#include <storage/registry/Scheme.hpp>

#include <boost/property_tree/ptree.hpp>

#include <atomic>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

namespace foundation::storage::registry {

/// Opens any location whose scheme it knows, by the factory that was added for the scheme; see `registerAll`.
///
/// Letter case of schemes is ignored. Of nested containers the outermost store is opened first, then each container in
/// it, so that `zip:tar:mem:///a.tar!/b.zip!/c` takes three factories.
///
/// Passwords and keys belong to the configuration. A location that carries a password is refused, and no error repeats
/// it (see `hasPassword`). Once `configure` gave settings to a scheme, its factory and providers are taken to repeat
/// them in whatever they throw: `open`, `configure` and `shutdown` then throw a `FactoryException` instead, which keeps
/// the code and nothing else; `std::bad_alloc` passes. That holds for the containers that lie in such a store, too.
/// What providers say in operations of an opened item passes unchanged, and is theirs to answer for.
///
/// Ownership: shares the factories, keeps no provider alive. Items keep all they need, the providers of the containers
/// they lie in included, and may outlive the registry.
/// Threads: `open`, `schemes`, `configure`, `flush` and `shutdown` may be used from any number of threads at once,
/// `add` by nobody beside.
class FOUNDATION_API Registry
{
public:
    Registry();
    Registry(Registry const&) = delete;
    Registry& operator=(Registry const&) = delete;
    ~Registry();

    /// Has `factory` serve the locations of a scheme. Throws `std::invalid_argument` for a malformed scheme, one that
    /// is served already, and an empty pointer.
    void add(std::u16string const& scheme, std::shared_ptr<provider::PhysicalProviderFactory> factory);

    /// Has `factory` serve the places inside containers of a scheme. Throws as the other form.
    void add(std::u16string const& scheme, std::shared_ptr<provider::ContainerProviderFactory> factory);

    /// The item at the location that a text names.
    ///
    /// Errors: as the other form; for a text that is no location an `OpenException` too when a scheme in it is not
    /// served that way, else what the constructor of `StorageIRI` throws.
    provider::StorageItem open(std::u16string const& text) const;

    /// The item at a location; whether anything is there is not looked at, except by factories of containers.
    ///
    /// Errors: `OpenException` before any provider is built; what a factory throws; `InternalError` when it makes no
    /// provider.
    provider::StorageItem open(provider::StorageIRI const& location) const;

    /// What is served, sorted by name.
    std::vector<Scheme> schemes() const;

    /// Hands each factory its part of the settings: the child that bears the name of its scheme. Schemes that the tree
    /// does not name keep what they have.
    ///
    /// Errors: `std::invalid_argument` that names the key, before anything is configured, for a key that is no scheme
    /// served here, stands there twice, or is a scheme of containers, which take no settings. A failing factory stops
    /// none of the others; the first failure is thrown when all were visited, as `FactoryException`.
    void configure(boost::property_tree::ptree const& settings);

    /// Has every live provider of a container that was opened here write what is pending, the innermost containers
    /// first, since they write into those round them. A failure stops none of the others; the first one is thrown at
    /// the end, unchanged, as from an operation of an opened item. All of them can be used on.
    void flush();

    /// Does what `flush` does and shuts down every other live provider after that. A failing factory stops none of the
    /// others; the first failure is thrown when all were visited. What is opened later works as ever.
    void shutdown();

private:
    using Physical = std::shared_ptr<provider::PhysicalProviderFactory>;
    using Container = std::shared_ptr<provider::ContainerProviderFactory>;
    using Factory = std::variant<Physical, Container>;

    struct Entry
    {
        explicit Entry(Factory given) : factory(std::move(given)) {}

        SchemeKind kind() const;

        Factory factory;
        std::atomic<bool> hasSettings = false;
    };
    using Entries = std::map<std::u16string, Entry>;

    /// The provider of a container's inside, which may be gone by now.
    struct Inside
    {
        std::weak_ptr<provider::IProvider> provider;
        provider::StorageIRI location;
        std::size_t depth; ///< how many containers lie round the place
    };

    /// A location, and who serves it.
    struct Level
    {
        provider::StorageIRI location;
        Entry const& entry;
    };

    class Visit;

    void addFactory(std::u16string const& scheme, Factory factory);
    void refusePassword(std::u16string const& text) const;
    provider::StorageIRI parse(std::u16string const& text) const;
    void requireServedSchemes(std::u16string_view text) const;
    std::vector<Level> levelsOf(provider::StorageIRI const& location) const;
    Entry const& find(std::u16string_view scheme, SchemeKind kind, provider::StorageIRI const& location) const;
    std::u16string const& requireConfigurable(std::string const& key) const;
    void configureScheme(std::u16string const& scheme, boost::property_tree::ptree const& settings);
    void shutdownInside(Inside const& inside, provider::IProvider& provider);
    void shutdownScheme(std::u16string const& scheme, Entry const& entry);
    bool mayRepeatSettings(Entry const& entry) const;
    void remember(std::shared_ptr<provider::IProvider> const& inside, Level const& level, std::size_t depth) const;
    std::vector<Inside> insidesFromWithin() const;

    Entries entries_;
    mutable std::mutex mutex_;
    mutable std::map<provider::IProvider const*, Inside> insides_;
    mutable std::size_t insidesToTidy_ = 64; ///< so many that those which are gone are looked for
};

} // namespace foundation::storage::registry
