#pragma once

#include <foundation/export.hpp>
#include <foundation/network/detail/IRILayout.hpp>

#include <string>
#include <string_view>
#include <utility>

namespace foundation::network {

class IRIArgs;

namespace iri {

/// How a component that holds data (host, path) is read.
enum class Encoding
{
    Decoded = 0, ///< plain text: escapes that form valid UTF-8 are decoded, all others stay as they are
    Encoded = 1, ///< as written
};

/// A plain path as it is written in an IRI: all that RFC 3987 `ipchar` and '/' do not cover, and '%', as the upper-case
/// escapes of its UTF-8 bytes. Throws `std::out_of_range` for a lone surrogate.
FOUNDATION_API std::u16string encodePath(std::u16string_view plain);

} // namespace iri

/// An internationalised resource identifier or relative reference (RFC 3986, RFC 3987); an immutable value.
///
/// Keeps its text as written. Only what no IRI may hold (controls, space, `"<>\^{|}`, the backtick, and a '%' that two
/// hex digits do not follow) is percent-encoded on the way in.
class FOUNDATION_API IRI
{
public:
    /// Parses `text`; without a scheme (RFC 3986, section 3.1) it is a relative reference.
    /// Throws `std::out_of_range` for a lone surrogate, `std::invalid_argument` for a port beyond 65535.
    explicit IRI(std::u16string const& text);
    explicit IRI(std::u16string&& text);

    /// The IRI that a record of plain components describes: percent-encodes what each component may not hold.
    /// A path without authority that begins with "//" is written "/%2F…"; the first segment of a relative path has its
    /// ':' written "%3A".
    /// Throws `std::out_of_range` for a character that is not a Unicode scalar value, `std::invalid_argument` for a
    /// path that does not begin with '/' behind an authority.
    explicit IRI(IRIArgs const& args);

    /// Whether it has a scheme.
    bool isAbsolute() const { return layout_.hasScheme(); }

    /// Whether it has a scheme, and what follows does not begin with '/'.
    bool isOpaque() const;

    /// Whether it has an authority; its host may be empty (`file:///tmp`).
    bool hasHost() const { return layout_.hasAuthority; }

    std::u16string getScheme() const;
    std::u16string getHost(iri::Encoding const& encoding) const;
    std::u16string getPath(iri::Encoding const& encoding) const;

    /// All that follows the scheme's ':', as written under either encoding: it is structure, not data.
    std::u16string getSchemeSpecificPart(iri::Encoding const& encoding) const;

    std::u16string toString() const& { return text_; }
    std::u16string toString() && { return std::move(text_); }

    /// Resolves this reference against `base` (RFC 3986, section 5.2, strict).
    IRI resolveAgainst(IRI const& base) const;

    /// The reference that leads from `base` to this IRI: resolved against `base` it has this path. Segments "." and
    /// ".." are written as escapes, because resolution would remove them. Where scheme or authority differ it holds
    /// them, too. A relative path leads nowhere else from any base, and is answered as it is.
    IRI makeRelativeTo(IRI const& base) const;

    /// The same IRI less one '/' that is written at the end of a longer path; the rest stays as written.
    IRI withoutTrailingSlash() const&;
    IRI withoutTrailingSlash() &&;

private:
    friend class IRIArgs;

    struct Written
    {};
    IRI(Written, std::u16string text);

    /// `present` are the classes of the text.
    IRI(std::u16string&& text, detail::CharacterClass present);

    /// Whether a relative reference can lead from `base` to here.
    bool isReachableFrom(IRI const& base) const;

    /// The IRI of a written path with the scheme, authority and query of others, and this one's fragment.
    IRI assemble(IRI const& scheme, IRI const& authority, std::u16string path, IRI const& query) const;

    std::u16string_view scheme() const { return part(layout_.scheme()); }
    std::u16string_view path() const { return part(layout_.path()); }
    std::u16string_view part(detail::Span span) const
    {
        return std::u16string_view(text_).substr(span.begin, span.size());
    }

    std::u16string text_;
    detail::IRILayout layout_;
};

} // namespace foundation::network
