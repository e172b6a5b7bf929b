#pragma once

#include <fl/filesystem/upath.hpp>
#include <foundation/export.hpp>
#include <foundation/network/IRI.hpp>
#include <storage/provider/detail/LazyField.hpp>

#include <atomic>
#include <cstddef>
#include <memory>
#include <string>

namespace foundation::storage::provider {
class StorageIRI;
} // namespace foundation::storage::provider

namespace foundation::storage::provider::detail {

/// What every kind of location answers; see `StorageIRI` for the meaning of each operation.
///
/// Objects live behind `std::shared_ptr` and never move: their lazy fields hold a pointer to them. Apart from the
/// filling of those fields they are immutable.
class FOUNDATION_API StorageIRIImpl
{
public:
    StorageIRIImpl(StorageIRIImpl const&) = delete;
    StorageIRIImpl& operator=(StorageIRIImpl const&) = delete;

    /// Both compare the canonical texts by code unit.
    virtual bool equals(StorageIRIImpl const& other) const;
    virtual bool less(StorageIRIImpl const& other) const;

    virtual std::u16string getScheme() const = 0;
    virtual std::shared_ptr<StorageIRIImpl> const& getParent() const = 0;
    virtual bool hasParent() const = 0;
    virtual std::shared_ptr<StorageIRIImpl> getRoot() const = 0;
    virtual bool hasPath() const = 0;
    virtual std::u16string const& getPath() const = 0;
    virtual std::u16string const& getName() const = 0;
    virtual std::u16string const& toString() const = 0;
    virtual std::u16string getHost() const = 0;
    virtual bool hasHost() const = 0;
    virtual bool isOpaque() const = 0;
    virtual network::IRI toIRI() const = 0;
    virtual bool hasInnerIRI() const = 0;
    virtual std::shared_ptr<StorageIRIImpl> getInnerIRI() const = 0;
    virtual fl::filesystem::upath toUPath() const = 0;
    virtual ~StorageIRIImpl() = default;

    /// The same kind of location, with the same scheme, host and inner location, and the given absolute path (plain).
    virtual std::shared_ptr<StorageIRIImpl> withPath(std::u16string const& path) const = 0;

    std::u16string const& getResolvedPath() const { return resolvedPath_.get(); }

protected:
    StorageIRIImpl();

private:
    friend class provider::StorageIRI;

    /// The hash of `toString`, folded on first request.
    std::size_t hash() const;

    /// 0 until the text is folded. A text whose hash is 0 is folded each time; the empty one is the only one known.
    mutable std::atomic<std::size_t> hash_{0};
    LazyField<std::u16string> resolvedPath_;
};

/// The implementation for a parsed IRI: a container location for an opaque one, a hierarchical location for any other.
std::shared_ptr<StorageIRIImpl> makeStorageIRIImpl(network::IRI iri);

/// The reference of a plain path alone. An absolute one stands behind an empty authority, where a leading "//" stays
/// two separators; without an authority it would be written "/%2F…", as part of a name.
network::IRI iriOfPath(std::u16string const& path);

/// Removes one trailing '/' of a text that is longer than that.
void stripTrailingSlash(std::u16string& path);

[[noreturn]] void throwNotAbsolute(std::u16string const& iriText);
[[noreturn]] void throwNoParent();
[[noreturn]] void throwNoInnerIRI();

} // namespace foundation::storage::provider::detail
