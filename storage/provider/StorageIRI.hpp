#pragma once

#include <fl/filesystem/upath.hpp>
#include <foundation/export.hpp>
#include <foundation/network/IRI.hpp>
#include <storage/provider/PathView.hpp>

#include <cstddef>
#include <functional>
#include <iosfwd>
#include <memory>
#include <string>

namespace foundation::storage::provider {

namespace detail {
class StorageIRIImpl;
} // namespace detail

/// The name of a location: a file or folder on a hierarchical store (scheme, host, path), a file-system path under a
/// scheme, or a place inside a container that another location names.
///
/// An immutable value; copies share one implementation. Paths begin with '/', and carry no trailing '/' but the root's.
/// Everything derived from the text is computed on first request and kept, so that repeated queries that answer a
/// reference cost neither time nor memory. References stay valid as long as any copy of the location lives.
///
/// Threads: may be used from any number of threads at once.
class FOUNDATION_API StorageIRI
{
public:
    /// Parses text (RFC 3987): one with an opaque part names a location inside a container, any other a hierarchical
    /// one. A single trailing '/' of the path is not part of the location. Throws
    /// `AnonymousInternalException<std::runtime_error>` for text without a scheme and for a malformed container,
    /// `std::out_of_range` for a lone surrogate, `std::invalid_argument` for a port beyond 65535.
    explicit StorageIRI(std::u16string text);
    explicit StorageIRI(network::IRI iri);

    /// The location of a file-system path under a scheme.
    /// Throws `AnonymousInternalException<std::runtime_error>` for a relative path; an empty one is accepted.
    StorageIRI(std::u16string scheme, fl::filesystem::upath path);

    /// The location of the plain `path` inside the container that stands at `inner`; an empty path stands for "/".
    /// Throws `AnonymousInternalException<std::runtime_error>` for a scheme that cannot begin an IRI and for a path
    /// that does not begin with '/', `std::out_of_range` for a lone surrogate.
    StorageIRI(std::u16string const& scheme, StorageIRI const& inner, std::u16string path);

    /// A child of `base`: a relative text is joined to the path, less one trailing '/'; one that begins with '/'
    /// replaces it. "." and ".." stay as they are. The text is plain, never escaped. Throws `std::out_of_range` for a
    /// lone surrogate.
    StorageIRI(StorageIRI const& base, std::u16string const& child);

    explicit StorageIRI(std::shared_ptr<detail::StorageIRIImpl> implementation);

    /// Copied, never moved from, so that no location is ever empty.
    StorageIRI(StorageIRI const&) = default;
    StorageIRI& operator=(StorageIRI const&) = default;
    ~StorageIRI() = default;

    std::u16string getScheme() const;

    bool hasHost() const;
    /// Plain (not escaped); empty where there is none. Throws `std::logic_error` for a location inside a container.
    std::u16string getHost() const;

    /// Whether the location lies inside a container.
    bool hasInnerIRI() const;
    /// Where the container stands. Throws `AnonymousInternalException<std::logic_error>` without one.
    StorageIRI getInnerIRI() const;

    bool hasPath() const;
    /// Plain (not escaped).
    std::u16string const& getPath() const;
    PathView getPathView() const;
    /// Throws `std::logic_error` for a location inside a container.
    fl::filesystem::upath toUPath() const;

    bool hasParent() const;
    /// Throws `AnonymousInternalException<std::logic_error>` at the top.
    StorageIRI getParent() const;
    /// The last segment of the path; "/" for the root.
    std::u16string const& getName() const;

    bool isOpaque() const;
    network::IRI toIRI() const;
    /// The canonical text; equality, order and hash rest on it. Two locations of file-system paths are the exception:
    /// their paths decide equality and order, whatever their schemes. Throws `std::range_error` for such a path that
    /// holds a lone surrogate.
    std::u16string const& toString() const;

    /// The path without "." and ".." segments (RFC 3986, section 5.2.4).
    std::u16string const& getResolvedPath() const;
    StorageIRI getResolvedIRI() const;

    /// Whether this location stands above `other`, by scheme and path alone. No location is its own ancestor.
    bool isAncestorOf(StorageIRI other) const;

    /// The path that leads from the folder `base` to this location, plain (not escaped).
    /// Throws `std::runtime_error` when the two have different roots.
    std::u16string makePathRelativeTo(StorageIRI const& base) const;

    /// A 64-bit fold of the code units of `toString`, the same on every machine and with every version of Boost.
    /// Folded on first request, and kept for all copies.
    std::size_t hashValue() const;

    bool operator==(StorageIRI const& other) const;
    bool operator!=(StorageIRI const& other) const;
    bool operator<(StorageIRI const& other) const;

private:
    std::shared_ptr<detail::StorageIRIImpl> implementation_;
};

/// Makes locations keys of Boost's hashed containers.
FOUNDATION_API std::size_t hash_value(StorageIRI const& iri);

/// Writes `toString` in UTF-8.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, StorageIRI const& iri);

} // namespace foundation::storage::provider

template <>
struct std::hash<foundation::storage::provider::StorageIRI>
{
    std::size_t operator()(foundation::storage::provider::StorageIRI const& iri) const { return iri.hashValue(); }
};
