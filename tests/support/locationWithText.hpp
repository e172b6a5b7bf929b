#pragma once

#include <storage/provider/StorageIRI.hpp>
#include <storage/provider/detail/StorageIRIImpl.hpp>

#include <memory>
#include <stdexcept>
#include <string>
#include <utility>

namespace foundation::tests::support {

/// A location of which nothing is known but its text, and that throws `std::logic_error` when asked for more.
class TextOnlyImpl : public storage::provider::detail::StorageIRIImpl
{
public:
    explicit TextOnlyImpl(std::u16string text) : text_(std::move(text)) {}

    std::u16string const& toString() const override { return text_; }

    std::u16string getScheme() const override { refuse(); }
    std::shared_ptr<StorageIRIImpl> const& getParent() const override { refuse(); }
    bool hasParent() const override { refuse(); }
    std::shared_ptr<StorageIRIImpl> getRoot() const override { refuse(); }
    bool hasPath() const override { refuse(); }
    std::u16string const& getPath() const override { refuse(); }
    std::u16string const& getName() const override { refuse(); }
    std::u16string getHost() const override { refuse(); }
    bool hasHost() const override { refuse(); }
    bool isOpaque() const override { refuse(); }
    network::IRI toIRI() const override { refuse(); }
    bool hasInnerIRI() const override { refuse(); }
    std::shared_ptr<StorageIRIImpl> getInnerIRI() const override { refuse(); }
    fl::filesystem::upath toUPath() const override { refuse(); }
    std::shared_ptr<StorageIRIImpl> withPath(std::u16string const&) const override { refuse(); }

private:
    [[noreturn]] static void refuse() { throw std::logic_error("This location knows its text alone."); }

    std::u16string text_;
};

inline storage::provider::StorageIRI locationWithText(std::u16string text)
{
    return storage::provider::StorageIRI(std::make_shared<TextOnlyImpl>(std::move(text)));
}

} // namespace foundation::tests::support
