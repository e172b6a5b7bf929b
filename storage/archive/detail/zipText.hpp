#pragma once

#include <foundation/export.hpp>

#include <string>
#include <string_view>

namespace foundation::storage::archive::detail {

/// A name or the target of a link in a zip: in UTF-8, flagged or not, unless it cannot be; then it is in the characters
/// of the first PCs (code page 437). Control characters are those of ASCII in both.
FOUNDATION_API std::u16string fromZipText(std::string_view bytes);

} // namespace foundation::storage::archive::detail
