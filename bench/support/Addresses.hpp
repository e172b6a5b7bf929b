#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace bench {

/// Addresses as they occur: local files, deep folders, hosts with and without a port, names with escaped spaces, CJK
/// names (raw and escaped), rarely a query. About 88 characters on average. The same on every machine.
std::vector<std::u16string> makeAddresses(std::size_t count);

/// The UTF-8 form that a parser of RFC 3986 accepts: what is not ASCII is percent-encoded.
std::string toURL(std::u16string const& address);

/// A number that changes with any character of any of the addresses (FNV-1a).
std::size_t fingerprint(std::vector<std::u16string> const& addresses);

} // namespace bench
