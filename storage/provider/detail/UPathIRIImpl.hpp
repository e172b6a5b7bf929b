#pragma once

#include <fl/filesystem/path_functions.hpp>
#include <fl/filesystem/upath.hpp>
#include <storage/provider/detail/StorageIRIImpl.hpp>

#include <functional>

namespace foundation::storage::provider::detail {

/// A location given as a scheme and a file-system path; its text is the scheme, "://" and the escaped path.
///
/// Two of them are equal when their paths are, whatever their schemes, and they are ordered by the elements of their
/// paths; beside another kind of location the text decides.
class FOUNDATION_API UPathIRIImpl : public StorageIRIImpl
{
public:
    /// Takes the path as it is; an empty one is accepted. Throws `AnonymousInternalException<std::runtime_error>` for
    /// a relative path.
    UPathIRIImpl(std::u16string scheme, fl::filesystem::upath path);

    /// The same with a text that is known already.
    UPathIRIImpl(std::u16string scheme, fl::filesystem::upath path, std::u16string text);

    bool equals(StorageIRIImpl const& other) const override;
    bool less(StorageIRIImpl const& other) const override;
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
    void requireAbsolute() const;
    std::u16string makeText() const;
    std::shared_ptr<StorageIRIImpl> makeParent() const;

    std::u16string scheme_;
    fl::filesystem::upath upath_;
    LazyField<std::u16string> text_;
    std::u16string name_ = fl::filesystem::detail::extract_filename(upath_.string());
    std::u16string path_ = fl::filesystem::detail::make_generic_form(upath_.string());
    LazyField<std::shared_ptr<StorageIRIImpl>> parent_{
        std::function<std::shared_ptr<StorageIRIImpl>()>([this] { return makeParent(); })};
};

} // namespace foundation::storage::provider::detail
