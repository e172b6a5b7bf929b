#pragma once

#include <foundation/network/detail/characters.hpp>

#include <cstddef>
#include <string_view>

namespace foundation::network::detail {

struct Span
{
    std::size_t begin = 0;
    std::size_t end = 0;

    std::size_t size() const { return end - begin; }
};

/// Where the components of an IRI lie in its text (RFC 3986, appendix B), by the positions where they meet.
/// A component that is absent has an empty span; the flags tell it from one that is empty.
struct IRILayout
{
    std::size_t schemeEnd = 0;
    std::size_t authorityBegin = 0;
    std::size_t hostBegin = 0;
    std::size_t hostEnd = 0;
    std::size_t pathBegin = 0; ///< where the authority ends
    std::size_t pathEnd = 0;
    std::size_t queryEnd = 0;
    std::size_t textEnd = 0;
    bool hasAuthority = false;
    bool hasUserInfo = false;
    bool hasQuery = false;
    bool hasFragment = false;

    /// A scheme has at least one character.
    bool hasScheme() const { return schemeEnd != 0; }
    bool hasPort() const { return port().size() != 0; }

    Span scheme() const { return {0, schemeEnd}; }
    Span authority() const { return {authorityBegin, pathBegin}; }
    Span userInfo() const { return {authorityBegin, hasUserInfo ? hostBegin - 1 : authorityBegin}; }
    Span host() const { return {hostBegin, hostEnd}; }
    Span port() const { return {hostEnd != pathBegin ? hostEnd + 1 : hostEnd, pathBegin}; }
    Span path() const { return {pathBegin, pathEnd}; }
    Span query() const { return {hasQuery ? pathEnd + 1 : pathEnd, queryEnd}; }
    Span fragment() const { return {hasFragment ? queryEnd + 1 : queryEnd, textEnd}; }
};

/// `present` covers the classes of all characters of the text: what cannot be there is not looked for.
/// Throws `std::invalid_argument` for a port beyond 65535.
IRILayout layOut(std::u16string_view text, CharacterClass present = anyClass);

/// The value of a run of digits, for a span that `layOut` accepted.
unsigned portNumber(std::u16string_view digits);

} // namespace foundation::network::detail
