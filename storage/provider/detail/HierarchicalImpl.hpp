#pragma once

#include <foundation/network/IRIArgs.hpp>
#include <storage/provider/detail/StorageIRIImpl.hpp>

#include <functional>
#include <utility>

namespace foundation::storage::provider::detail {

/// A location with a scheme, an optional authority and a path (`s://h/a/b`).
///
/// Everything is computed on first use, for many locations are made only to be passed on: a relative made by `withPath`
/// does not even build its IRI until something asks for it.
class FOUNDATION_API HierarchicalImpl : public StorageIRIImpl
{
public:
    /// Drops one trailing '/' of the path; nothing else is rewritten.
    /// Throws `AnonymousInternalException<std::runtime_error>` when the IRI has no scheme.
    explicit HierarchicalImpl(network::IRI iri);

    /// Takes the record as it is.
    explicit HierarchicalImpl(network::IRIArgs args);

    std::u16string getScheme() const override;
    std::shared_ptr<StorageIRIImpl> const& getParent() const override;
    bool hasParent() const override;
    std::shared_ptr<StorageIRIImpl> getRoot() const override;
    bool hasPath() const override;
    std::u16string const& getPath() const override;
    std::u16string const& getName() const override;
    std::u16string const& toString() const override;
    std::u16string getHost() const override;
    bool hasHost() const override;
    bool isOpaque() const override;
    network::IRI toIRI() const override;
    bool hasInnerIRI() const override;
    std::shared_ptr<StorageIRIImpl> getInnerIRI() const override;
    fl::filesystem::upath toUPath() const override;
    std::shared_ptr<StorageIRIImpl> withPath(std::u16string const& path) const override;

private:
    /// `args` is the record, or the function that makes it.
    template <typename Args>
    HierarchicalImpl(std::function<network::IRI()> makeIRI, Args args);

    std::shared_ptr<StorageIRIImpl> makeParent() const;

    LazyField<network::IRI> iri_;
    LazyField<network::IRIArgs> iriArgs_;
    LazyField<std::u16string> text_;
    LazyField<std::u16string> path_;
    LazyField<std::shared_ptr<StorageIRIImpl>> root_;
    LazyField<std::shared_ptr<StorageIRIImpl>> parent_;
    LazyField<std::pair<std::u16string, std::u16string>> nameSplit_;
};

} // namespace foundation::storage::provider::detail
