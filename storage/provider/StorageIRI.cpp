#include <storage/provider/StorageIRI.hpp>

#include <foundation/ustring.hpp>
#include <storage/provider/detail/ContainerImpl.hpp>
#include <storage/provider/detail/UPathIRIImpl.hpp>

#include <ostream>
#include <sstream>
#include <stdexcept>
#include <utility>

namespace foundation::storage::provider {

namespace {

constexpr char16_t separator = u'/';

std::u16string joinPath(std::u16string const& path, std::u16string_view child)
{
    std::u16string joined;
    joined.reserve(path.size() + 1 + child.size());
    joined += path;
    if (!child.empty() && !path.ends_with(separator))
        joined += separator;
    if (child.ends_with(separator))
        child.remove_suffix(1);
    joined += child;
    return joined;
}

std::u16string childPath(StorageIRI const& base, std::u16string const& child)
{
    if (!child.starts_with(separator))
        return joinPath(base.getPath(), child);
    auto const firstOther = child.find_first_not_of(separator);
    return separator + (firstOther == std::u16string::npos ? std::u16string() : child.substr(firstOther));
}

[[noreturn]] void throwNoCommonRoot(StorageIRI const& location, StorageIRI const& base)
{
    std::ostringstream message;
    message << "Can not make relative path between " << location << " and " << base
            << " as they don't have a common root.";
    throw std::runtime_error(message.str());
}

} // namespace

StorageIRI::StorageIRI(std::u16string text) : StorageIRI(network::IRI(std::move(text))) {}

StorageIRI::StorageIRI(network::IRI iri) : implementation_(detail::makeStorageIRIImpl(std::move(iri))) {}

StorageIRI::StorageIRI(std::u16string scheme, fl::filesystem::upath path)
    : implementation_(new detail::UPathIRIImpl(std::move(scheme), std::move(path)))
{}

StorageIRI::StorageIRI(std::u16string const& scheme, StorageIRI const& inner, std::u16string path)
    : implementation_(std::make_shared<detail::ContainerImpl>(scheme, inner.implementation_, std::move(path)))
{}

StorageIRI::StorageIRI(StorageIRI const& base, std::u16string const& child)
    : implementation_(base.implementation_->withPath(childPath(base, child)))
{}

StorageIRI::StorageIRI(std::shared_ptr<detail::StorageIRIImpl> implementation)
    : implementation_(std::move(implementation))
{}

std::u16string StorageIRI::getScheme() const
{
    return implementation_->getScheme();
}

bool StorageIRI::hasHost() const
{
    return implementation_->hasHost();
}

std::u16string StorageIRI::getHost() const
{
    return implementation_->getHost();
}

bool StorageIRI::hasInnerIRI() const
{
    return implementation_->hasInnerIRI();
}

StorageIRI StorageIRI::getInnerIRI() const
{
    return StorageIRI(implementation_->getInnerIRI());
}

bool StorageIRI::hasPath() const
{
    return implementation_->hasPath();
}

std::u16string const& StorageIRI::getPath() const
{
    return implementation_->getPath();
}

PathView StorageIRI::getPathView() const
{
    return PathView(getPath());
}

fl::filesystem::upath StorageIRI::toUPath() const
{
    return implementation_->toUPath();
}

bool StorageIRI::hasParent() const
{
    return implementation_->hasParent();
}

StorageIRI StorageIRI::getParent() const
{
    return StorageIRI(implementation_->getParent());
}

std::u16string const& StorageIRI::getName() const
{
    return implementation_->getName();
}

bool StorageIRI::isOpaque() const
{
    return implementation_->isOpaque();
}

network::IRI StorageIRI::toIRI() const
{
    return implementation_->toIRI();
}

std::u16string const& StorageIRI::toString() const
{
    return implementation_->toString();
}

std::u16string const& StorageIRI::getResolvedPath() const
{
    return implementation_->getResolvedPath();
}

StorageIRI StorageIRI::getResolvedIRI() const
{
    return StorageIRI(*this, getResolvedPath());
}

bool StorageIRI::isAncestorOf(StorageIRI other) const
{
    if (getScheme() != other.getScheme())
        return false;
    u16string_view const candidate = getPathView().toStringView();
    PathView view = other.getPathView();
    while (view.hasParent()) {
        view = view.getParentView();
        if (view.toStringView() == candidate)
            return true;
    }
    return false;
}

std::u16string StorageIRI::makePathRelativeTo(StorageIRI const& base) const
{
    if (!base.implementation_->getRoot()->equals(*implementation_->getRoot()))
        throwNoCommonRoot(*this, base);
    std::u16string baseFolder = base.getPath();
    if (baseFolder.size() > 1)
        baseFolder += separator;
    network::IRI const relative = detail::iriOfPath(getPath()).makeRelativeTo(detail::iriOfPath(baseFolder));
    return relative.getPath(network::iri::Encoding::Decoded);
}

std::size_t StorageIRI::hashValue() const
{
    return implementation_->hash();
}

bool StorageIRI::operator==(StorageIRI const& other) const
{
    return implementation_->equals(*other.implementation_);
}

bool StorageIRI::operator!=(StorageIRI const& other) const
{
    return !(*this == other);
}

bool StorageIRI::operator<(StorageIRI const& other) const
{
    return implementation_->less(*other.implementation_);
}

std::size_t hash_value(StorageIRI const& iri)
{
    return iri.hashValue();
}

std::ostream& operator<<(std::ostream& stream, StorageIRI const& iri)
{
    return ustring::insert(stream, iri.toString());
}

} // namespace foundation::storage::provider
