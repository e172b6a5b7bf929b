#pragma once

#include <foundation/export.hpp>

#include <cstdint>
#include <string>

namespace foundation::network {

class IRI;

/// The components of an IRI as plain (decoded) text in UTF-32. A component counts when its flag is set.
class FOUNDATION_API IRIArgs
{
public:
    /// No component at all.
    IRIArgs() = default;

    /// The components of `iri`.
    explicit IRIArgs(IRI const& iri);

    std::wstring scheme;
    std::wstring userInfo;
    std::wstring host;
    std::wstring path;
    std::wstring query;
    std::wstring fragment;
    std::uint16_t port = 0;

    bool hasScheme = false;
    bool hasUserInfo = false;
    bool hasHost = false; ///< with an empty host the authority is written, and is empty (`file:///tmp`)
    bool hasPort = false;
    bool hasPath = false;
    bool hasQuery = false;
    bool hasFragment = false;
    bool pathIsEncoded = false; ///< the path is written already, and used as given
};

} // namespace foundation::network
