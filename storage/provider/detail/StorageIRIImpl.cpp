#include <storage/provider/detail/StorageIRIImpl.hpp>

#include <foundation/core/except/AnonymousInternalException.hpp>
#include <foundation/network/IRIArgs.hpp>
#include <foundation/network/wide.hpp>
#include <foundation/ustring.hpp>

#include <algorithm>
#include <cstdint>
#include <sstream>
#include <stdexcept>

namespace foundation::storage::provider::detail {

namespace {

using core::except::detail::AnonymousInternalException;

std::u16string resolvePath(std::u16string base, std::u16string const& path)
{
    if (!base.ends_with(u'/'))
        base += u'/';
    if (path.find(u'/') == std::u16string::npos && path != u"." && path != u"..")
        return base + path;
    network::IRI const reference = iriOfPath(path);
    std::u16string resolved = reference.resolveAgainst(iriOfPath(base)).getPath(network::iri::Encoding::Decoded);
    stripTrailingSlash(resolved);
    return resolved;
}

/// The hash-combine step of Boost's 64-bit range hash, once for each code unit.
std::uint64_t fold(std::u16string const& text)
{
    constexpr std::uint64_t multiplier = 0xc6a4a7935bd1e995U;
    constexpr unsigned shift = 47;
    std::uint64_t hash = 0;
    for (char16_t const unit : text) {
        std::uint64_t key = unit * multiplier;
        key ^= key >> shift;
        key *= multiplier;
        hash ^= key;
        hash *= multiplier;
        hash += 0xe6546b64U;
    }
    return hash;
}

} // namespace

StorageIRIImpl::StorageIRIImpl()
    : resolvedPath_([this] { return getPath().size() > 1 ? resolvePath(u"/", getPath()) : getPath(); })
{}

bool StorageIRIImpl::equals(StorageIRIImpl const& other) const
{
    if (this == &other)
        return true;
    std::u16string const& text = toString();
    std::u16string const& otherText = other.toString();
    return std::equal(text.begin(), text.end(), otherText.begin(), otherText.end());
}

bool StorageIRIImpl::less(StorageIRIImpl const& other) const
{
    return this != &other && toString() < other.toString();
}

// Threads that meet here fold the same text to the same number, and nothing else is published with it.
std::size_t StorageIRIImpl::hash() const
{
    std::size_t known = hash_.load(std::memory_order_relaxed);
    if (known == 0) {
        known = fold(toString());
        hash_.store(known, std::memory_order_relaxed);
    }
    return known;
}

network::IRI iriOfPath(std::u16string const& path)
{
    network::IRIArgs args;
    args.hasHost = path.starts_with(u'/');
    args.hasPath = true;
    args.path = network::toWide(path);
    return network::IRI(args);
}

void stripTrailingSlash(std::u16string& path)
{
    if (path.size() > 1 && path.back() == u'/')
        path.pop_back();
}

void throwNotAbsolute(std::u16string const& iriText)
{
    std::ostringstream message;
    message << "IRI '";
    ustring::insert(message, iriText) << "' is not absolute.";
    throw AnonymousInternalException<std::runtime_error>(message.str());
}

void throwNoParent()
{
    throw AnonymousInternalException<std::logic_error>("IRI does not have a parent IRI.");
}

void throwNoInnerIRI()
{
    throw AnonymousInternalException<std::logic_error>("IRI does not have an inner IRI.");
}

} // namespace foundation::storage::provider::detail
