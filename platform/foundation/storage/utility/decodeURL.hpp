#pragma once

#include <foundation/export.hpp>

#include <string>

namespace foundation::storage::utility {

/// Percent-decodes `text` in place: escapes that form valid UTF-8 are decoded, all others stay as they are.
FOUNDATION_API void decodeURL(std::u16string& text);

} // namespace foundation::storage::utility
