#pragma once

#include <storage/provider/detail/StorageIRIImpl.hpp>

#include <utility>

namespace foundation::storage::provider::detail {

/// A location inside a container that stands at another location: `scheme:inner-text!path` (`zip:file:///a.zip!/docs`).
///
/// The last '!' of the text ends the inner location; in a path that is written here, a '!' is escaped.
class FOUNDATION_API ContainerImpl : public StorageIRIImpl
{
public:
    /// The location of a plain path; an empty one stands for "/". One trailing '/' is kept in the path and left out of
    /// the text. Throws `AnonymousInternalException<std::runtime_error>` for a scheme that cannot begin an IRI and for
    /// a path that does not begin with '/', `std::out_of_range` for a lone surrogate.
    ContainerImpl(std::u16string const& scheme, std::shared_ptr<StorageIRIImpl> inner, std::u16string path);

    /// Parses an opaque IRI. Throws `AnonymousInternalException<std::runtime_error>` for one that has no scheme, no
    /// '!', no '/' behind the last '!', or an inner location that is none.
    explicit ContainerImpl(network::IRI iri);

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
    std::shared_ptr<StorageIRIImpl> makeParent() const;

    std::shared_ptr<StorageIRIImpl> inner_;
    std::u16string path_;
    network::IRI iri_;
    LazyField<std::u16string> text_;
    LazyField<std::shared_ptr<StorageIRIImpl>> parent_;
    LazyField<std::pair<std::u16string, std::u16string>> nameSplit_;
};

} // namespace foundation::storage::provider::detail
