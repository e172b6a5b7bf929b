#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace foundation::storage::tool {

/// The length of the scheme, or the short name of one, that a text begins with, without the ':' behind it; nothing
/// where it begins with none.
std::optional<std::size_t> schemeLength(std::string_view text);

/// An IRI with its schemes as the stores know them: short names ("7z") written out, since a scheme begins with a
/// letter, and all in lower case, so that no store has two names in one command.
std::string withKnownSchemes(std::string_view iri);

} // namespace foundation::storage::tool
