#include <storage/provider/detail/ContainerImpl.hpp>

#include <foundation/core/except/AnonymousInternalException.hpp>
#include <foundation/network/IRIArgs.hpp>
#include <foundation/network/wide.hpp>
#include <foundation/storage/utility/decodeURL.hpp>
#include <foundation/ustring.hpp>
#include <storage/provider/detail/splitName.hpp>

#include <sstream>
#include <stdexcept>

namespace foundation::storage::provider::detail {

namespace {

using network::IRI;
using network::iri::Encoding;
using NameSplit = std::pair<std::u16string, std::u16string>;

/// Takes a trailing '/' off a written text, but leaves the one of the root, behind the '!'.
void normaliseWritten(std::u16string& text)
{
    stripTrailingSlash(text);
    if (text.empty() || text.back() == u'!')
        text += u'/';
}

/// The path as it is written behind the '!': without a '!' of its own.
std::u16string writePath(std::u16string const& path)
{
    std::u16string encoded = network::iri::encodePath(path);
    if (encoded.find(u'!') == std::u16string::npos)
        return encoded;
    std::u16string written;
    for (char16_t const unit : encoded) {
        if (unit == u'!')
            written += u"%21";
        else
            written += unit;
    }
    return written;
}

IRI makeIRI(std::u16string const& scheme, StorageIRIImpl const& inner, std::u16string const& path)
{
    std::u16string text =
        inner.getScheme() + u":" + inner.toIRI().getSchemeSpecificPart(Encoding::Decoded) + u"!" + writePath(path);
    normaliseWritten(text);
    network::IRIArgs args;
    args.scheme = network::toWide(scheme);
    args.hasScheme = !scheme.empty();
    args.path = network::toWide(text);
    args.hasPath = args.pathIsEncoded = true;
    return IRI(args);
}

void requireAbsolute(IRI const& iri)
{
    if (!iri.isAbsolute())
        throwNotAbsolute(iri.toString());
}

[[noreturn]] void throwMalformed(IRI const& iri, char const* reason)
{
    std::ostringstream message;
    message << "Invalid container-style storage IRI '";
    ustring::insert(message, iri.toString()) << "'. " << reason;
    throw core::except::detail::AnonymousInternalException<std::runtime_error>(message.str());
}

void requireLeadingSlash(IRI const& iri, std::u16string_view path)
{
    if (!path.starts_with(u'/'))
        throwMalformed(iri, "Path should begin with a '/'.");
}

std::string describe(StorageIRIImpl const& location, char const* before, char const* after)
{
    std::ostringstream message;
    ustring::insert(message << before, location.toString()) << after;
    return message.str();
}

} // namespace

ContainerImpl::ContainerImpl(std::u16string const& scheme, std::shared_ptr<StorageIRIImpl> inner, std::u16string path)
    : inner_(std::move(inner)),
      path_(path.empty() ? std::u16string(u"/") : std::move(path)),
      iri_(makeIRI(scheme, *inner_, path_)),
      text_(std::function<std::u16string()>([this] { return iri_.toString(); })),
      parent_(std::function<std::shared_ptr<StorageIRIImpl>()>([this] { return makeParent(); })),
      nameSplit_(std::function<NameSplit()>([this] { return splitName(path_); }))
{
    requireAbsolute(iri_);
    requireLeadingSlash(iri_, path_);
}

ContainerImpl::ContainerImpl(IRI iri)
    : iri_(std::move(iri)),
      text_(std::function<std::u16string()>([this] {
          std::u16string text = iri_.toString();
          normaliseWritten(text);
          return text;
      })),
      parent_(std::function<std::shared_ptr<StorageIRIImpl>()>([this] { return makeParent(); })),
      nameSplit_(std::function<NameSplit()>([this] { return splitName(path_); }))
{
    requireAbsolute(iri_);
    std::u16string const rest = iri_.getSchemeSpecificPart(Encoding::Encoded);
    std::size_t const end = rest.rfind(u'!');
    if (end == std::u16string::npos)
        throwMalformed(iri_, "Expected to find a '!' to begin the path section.");
    path_ = rest.substr(end + 1);
    requireLeadingSlash(iri_, path_);
    inner_ = makeStorageIRIImpl(IRI(rest.substr(0, end)));
    normaliseWritten(path_);
    utility::decodeURL(path_);
}

std::u16string ContainerImpl::getScheme() const
{
    return toIRI().getScheme();
}

std::shared_ptr<StorageIRIImpl> const& ContainerImpl::getParent() const
{
    return parent_.get();
}

bool ContainerImpl::hasParent() const
{
    return path_ != u"/";
}

std::shared_ptr<StorageIRIImpl> ContainerImpl::getRoot() const
{
    return withPath(u"/");
}

bool ContainerImpl::hasPath() const
{
    return !path_.empty();
}

std::u16string const& ContainerImpl::getPath() const
{
    return path_;
}

std::u16string const& ContainerImpl::getName() const
{
    return nameSplit_.get().second;
}

std::u16string const& ContainerImpl::toString() const
{
    return text_.get();
}

std::u16string ContainerImpl::getHost() const
{
    throw std::logic_error(describe(*this, "StorageIRI ", " is container based so by definition has no host."));
}

bool ContainerImpl::hasHost() const
{
    return false;
}

bool ContainerImpl::isOpaque() const
{
    return true;
}

IRI ContainerImpl::toIRI() const
{
    return iri_;
}

bool ContainerImpl::hasInnerIRI() const
{
    return true;
}

std::shared_ptr<StorageIRIImpl> ContainerImpl::getInnerIRI() const
{
    return inner_;
}

fl::filesystem::upath ContainerImpl::toUPath() const
{
    throw std::logic_error(describe(*this, "Can not extract a file system path from StorageIRI ",
                                    " as it represents a location inside a container."));
}

std::shared_ptr<StorageIRIImpl> ContainerImpl::withPath(std::u16string const& path) const
{
    return std::make_shared<ContainerImpl>(iri_.getScheme(), inner_, path);
}

// The path of a parent is plain text: a '!' at its end belongs to a name.
std::shared_ptr<StorageIRIImpl> ContainerImpl::makeParent() const
{
    std::u16string path = nameSplit_.get().first;
    if (path.empty())
        throwNoParent();
    stripTrailingSlash(path);
    return withPath(path);
}

} // namespace foundation::storage::provider::detail
