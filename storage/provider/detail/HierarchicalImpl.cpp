#include <storage/provider/detail/HierarchicalImpl.hpp>

#include <fl/filesystem/path_functions.hpp>
#include <foundation/network/wide.hpp>
#include <storage/provider/detail/splitName.hpp>

namespace foundation::storage::provider::detail {

namespace {

using network::IRI;
using network::IRIArgs;
using network::iri::Encoding;

IRI requireAbsolute(IRI iri)
{
    if (!iri.isAbsolute())
        throwNotAbsolute(iri.toString());
    return iri;
}

} // namespace

template <typename Args>
HierarchicalImpl::HierarchicalImpl(std::function<IRI()> makeIRI, Args args)
    : iri_(std::move(makeIRI)),
      iriArgs_(std::move(args)),
      text_(std::function<std::u16string()>([this] { return toIRI().toString(); })),
      path_(std::function<std::u16string()>([this] { return iri_.get().getPath(Encoding::Decoded); })),
      root_(std::function<std::shared_ptr<StorageIRIImpl>()>([this] { return withPath(u"/"); })),
      parent_(std::function<std::shared_ptr<StorageIRIImpl>()>([this] { return makeParent(); })),
      nameSplit_(std::function<std::pair<std::u16string, std::u16string>()>([this] { return splitName(getPath()); }))
{}

// The function gives its IRI away: it cannot fail, so it is not run again.
HierarchicalImpl::HierarchicalImpl(IRI iri)
    : HierarchicalImpl(
          [given = requireAbsolute(std::move(iri))]() mutable { return std::move(given).withoutTrailingSlash(); },
          std::function<IRIArgs()>([this] { return IRIArgs(toIRI()); }))
{}

HierarchicalImpl::HierarchicalImpl(IRIArgs args)
    : HierarchicalImpl([this] { return IRI(iriArgs_.get()); }, std::move(args))
{}

std::u16string HierarchicalImpl::getScheme() const
{
    return toIRI().getScheme();
}

std::shared_ptr<StorageIRIImpl> const& HierarchicalImpl::getParent() const
{
    return parent_.get();
}

bool HierarchicalImpl::hasParent() const
{
    return getPath() != u"/";
}

std::shared_ptr<StorageIRIImpl> HierarchicalImpl::getRoot() const
{
    return root_.get();
}

bool HierarchicalImpl::hasPath() const
{
    return !toIRI().getPath(Encoding::Decoded).empty();
}

std::u16string const& HierarchicalImpl::getPath() const
{
    return path_.get();
}

std::u16string const& HierarchicalImpl::getName() const
{
    return nameSplit_.get().second;
}

std::u16string const& HierarchicalImpl::toString() const
{
    return text_.get();
}

std::u16string HierarchicalImpl::getHost() const
{
    return toIRI().getHost(Encoding::Decoded);
}

bool HierarchicalImpl::hasHost() const
{
    IRI const iri = toIRI();
    return iri.hasHost() && !iri.getHost(Encoding::Decoded).empty();
}

bool HierarchicalImpl::isOpaque() const
{
    return false;
}

IRI HierarchicalImpl::toIRI() const
{
    return iri_.get();
}

bool HierarchicalImpl::hasInnerIRI() const
{
    return false;
}

std::shared_ptr<StorageIRIImpl> HierarchicalImpl::getInnerIRI() const
{
    throwNoInnerIRI();
}

fl::filesystem::upath HierarchicalImpl::toUPath() const
{
    std::u16string const path = iri_.get().getPath(Encoding::Decoded);
    if (path.empty())
        return fl::filesystem::upath();
    return fl::filesystem::upath(fl::filesystem::detail::make_native_form(path, true), false);
}

std::shared_ptr<StorageIRIImpl> HierarchicalImpl::withPath(std::u16string const& path) const
{
    IRIArgs args = iriArgs_.get();
    args.path = network::toWide(path);
    args.hasPath = true;
    args.pathIsEncoded = false;
    return std::make_shared<HierarchicalImpl>(std::move(args));
}

std::shared_ptr<StorageIRIImpl> HierarchicalImpl::makeParent() const
{
    std::u16string path = nameSplit_.get().first;
    if (path.empty())
        throwNoParent();
    stripTrailingSlash(path);
    return withPath(path);
}

} // namespace foundation::storage::provider::detail
