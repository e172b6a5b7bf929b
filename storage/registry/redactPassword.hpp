#pragma once

#include <foundation/export.hpp>

#include <string>
#include <string_view>

namespace foundation::storage::registry {

/// Whether the authority of a location carries a password: `user:password@host`, however deep in containers it lies.
///
/// The text need not be a location, nor well formed. An escaped ':' or '@' counts like a plain one, and an empty
/// password as none. What stands for the port, is none, and is followed by an '@' further on counts as a password that
/// holds a '/', '?' or '#'. Cost: one pass.
FOUNDATION_API bool hasPassword(std::u16string_view location);

/// The text of a location with "***" for the password, so that it may be shown; any other text as it is.
FOUNDATION_API std::u16string redactPassword(std::u16string location);

} // namespace foundation::storage::registry
