#include <foundation/network/IRIArgs.hpp>

#include <foundation/network/IRI.hpp>
#include <foundation/network/detail/characters.hpp>
#include <foundation/network/wide.hpp>

namespace foundation::network {

IRIArgs::IRIArgs(IRI const& iri)
{
    detail::IRILayout const& layout = iri.layout_;
    auto const plain = [&iri](detail::Span span) { return toWide(detail::decodeEscapes(iri.part(span))); };
    scheme = plain(layout.scheme());
    userInfo = plain(layout.userInfo());
    host = plain(layout.host());
    path = plain(layout.path());
    query = plain(layout.query());
    fragment = plain(layout.fragment());
    port = static_cast<std::uint16_t>(detail::portNumber(iri.part(layout.port())));
    hasScheme = layout.hasScheme();
    hasUserInfo = layout.hasUserInfo;
    hasHost = layout.hasAuthority;
    hasPort = layout.hasPort();
    hasPath = layout.path().size() != 0;
    hasQuery = layout.hasQuery;
    hasFragment = layout.hasFragment;
}

} // namespace foundation::network
