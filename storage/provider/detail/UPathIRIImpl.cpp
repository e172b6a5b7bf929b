#include <storage/provider/detail/UPathIRIImpl.hpp>

#include <fl/i18n/convert.hpp>
#include <foundation/network/IRIArgs.hpp>
#include <foundation/network/wide.hpp>

#include <algorithm>
#include <string_view>
#include <utility>

namespace foundation::storage::provider::detail {

namespace {

using fl::filesystem::upath;
namespace path_functions = fl::filesystem::detail;

bool standsForItself(unsigned char byte)
{
    return (byte >= '0' && byte <= '9') || (byte >= 'A' && byte <= 'Z') || (byte >= 'a' && byte <= 'z') ||
           (byte != 0 && std::string_view("~$&+-./:@_").find(static_cast<char>(byte)) != std::string_view::npos);
}

/// The path as it is written in the text of a location.
std::u16string escapePath(std::u16string const& path)
{
    constexpr std::u16string_view digits = u"0123456789ABCDEF";
    std::string const bytes = fl::i18n::to_string(path, fl::i18n::codecvt_ustring_to_string("UTF-8", true));
    std::u16string escaped;
    escaped.reserve(bytes.size());
    for (char const c : bytes) {
        auto const byte = static_cast<unsigned char>(c);
        if (standsForItself(byte))
            escaped += byte;
        else
            ((escaped += u'%') += digits[byte >> 4]) += digits[byte & 0xF];
    }
    return escaped;
}

/// Takes the first element off a path; what is empty is the end.
std::u16string_view takeElement(std::u16string_view& path)
{
    path.remove_prefix(std::min(path.find_first_not_of(u'/'), path.size()));
    std::u16string_view const element = path.substr(0, path.find(u'/'));
    path.remove_prefix(element.size());
    return element;
}

std::u16string_view takeRoot(std::u16string_view& path, std::size_t length)
{
    std::u16string_view const root = path.substr(0, length);
    path.remove_prefix(length);
    return root;
}

/// Whether `left` comes first, by root and elements; of two that begin alike the shorter one does.
bool lessByElements(std::u16string const& left, std::u16string const& right)
{
    std::u16string_view leftRest = left;
    std::u16string_view rightRest = right;
    std::u16string_view mine = takeRoot(leftRest, path_functions::get_root_path_length(left));
    std::u16string_view others = takeRoot(rightRest, path_functions::get_root_path_length(right));
    while (mine == others) {
        if (leftRest.empty() && rightRest.empty())
            return false;
        mine = takeElement(leftRest);
        others = takeElement(rightRest);
    }
    return mine < others;
}

} // namespace

UPathIRIImpl::UPathIRIImpl(std::u16string scheme, upath path)
    : scheme_(std::move(scheme)),
      upath_(std::move(path)),
      text_(std::function<std::u16string()>([this] { return makeText(); }))
{
    requireAbsolute();
}

UPathIRIImpl::UPathIRIImpl(std::u16string scheme, upath path, std::u16string text)
    : scheme_(std::move(scheme)), upath_(std::move(path)), text_(std::move(text))
{
    requireAbsolute();
}

void UPathIRIImpl::requireAbsolute() const
{
    if (!path_.empty() && path_.front() != u'/' && !path_functions::is_absolute(upath_.string()))
        throwNotAbsolute(text_.get());
}

std::u16string UPathIRIImpl::makeText() const
{
    return scheme_ + u"://" + escapePath(path_);
}

bool UPathIRIImpl::equals(StorageIRIImpl const& other) const
{
    if (this == &other)
        return true;
    if (auto const* otherPath = dynamic_cast<UPathIRIImpl const*>(&other))
        return upath_ == otherPath->upath_;
    return StorageIRIImpl::equals(other);
}

bool UPathIRIImpl::less(StorageIRIImpl const& other) const
{
    if (this == &other)
        return false;
    if (auto const* otherPath = dynamic_cast<UPathIRIImpl const*>(&other))
        return lessByElements(upath_.string(), otherPath->upath_.string());
    return StorageIRIImpl::less(other);
}

std::u16string UPathIRIImpl::getScheme() const
{
    return scheme_;
}

std::shared_ptr<StorageIRIImpl> const& UPathIRIImpl::getParent() const
{
    return parent_.get();
}

bool UPathIRIImpl::hasParent() const
{
    return path_functions::get_root_path_length(upath_.string()) != upath_.string().size();
}

std::shared_ptr<StorageIRIImpl> UPathIRIImpl::getRoot() const
{
    return withPath(fl::filesystem::upath_constant::GENERIC_PATHNAME_SEPARATOR);
}

bool UPathIRIImpl::hasPath() const
{
    return !path_.empty();
}

std::u16string const& UPathIRIImpl::getPath() const
{
    return path_;
}

std::u16string const& UPathIRIImpl::getName() const
{
    return name_;
}

std::u16string const& UPathIRIImpl::toString() const
{
    return text_.get();
}

std::u16string UPathIRIImpl::getHost() const
{
    return {};
}

bool UPathIRIImpl::hasHost() const
{
    return false;
}

bool UPathIRIImpl::isOpaque() const
{
    return false;
}

// Written with the escapes of the text, so that both read the same, and with the empty authority that "://" begins.
network::IRI UPathIRIImpl::toIRI() const
{
    network::IRIArgs args;
    args.hasScheme = args.hasHost = args.hasPath = args.pathIsEncoded = true;
    args.scheme = network::toWide(scheme_);
    args.path = network::toWide(escapePath(path_));
    return network::IRI(args);
}

bool UPathIRIImpl::hasInnerIRI() const
{
    return false;
}

std::shared_ptr<StorageIRIImpl> UPathIRIImpl::getInnerIRI() const
{
    throwNoInnerIRI();
}

upath UPathIRIImpl::toUPath() const
{
    return upath_;
}

std::shared_ptr<StorageIRIImpl> UPathIRIImpl::withPath(std::u16string const& path) const
{
    if (path.empty())
        return std::make_shared<UPathIRIImpl>(scheme_, upath());
    return std::make_shared<UPathIRIImpl>(scheme_, upath(path_functions::make_native_form(path, true), false));
}

// A text that was made already serves the parent, too; that of a root is then "scheme://".
std::shared_ptr<StorageIRIImpl> UPathIRIImpl::makeParent() const
{
    std::u16string const parent = path_functions::extract_parent_path(upath_.string());
    if (parent.empty())
        throwNoParent();
    if (!text_.isPresent())
        return std::make_shared<UPathIRIImpl>(scheme_, upath(parent, true));
    std::u16string const& text = text_.get();
    return std::make_shared<UPathIRIImpl>(scheme_, upath(parent, true), text.substr(0, text.rfind(u'/')));
}

} // namespace foundation::storage::provider::detail
