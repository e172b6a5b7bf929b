#pragma once

#include <string>
#include <string_view>

#include <foundation/export.hpp>

namespace fl::filesystem {

/// The bytes of a file name or path, for the system calls, from its UTF-16 form.
///
/// Meaning: UTF-8, but each of U+EF80 to U+EFFF is the one byte 0x80 to 0xFF that `from_native_bytes` made it from.
/// Several of them that together spell valid UTF-8 therefore name the same file as the character spelled (U+EFC3 U+EFA9
/// and U+00E9); listings give the latter. U+0000 and "/" pass through: what they mean is the caller's business.
/// Errors: `std::range_error` for a surrogate that is not part of a pair, which no name on disk can stand for.
/// Cost: one pass and one allocation for a path of ordinary length.
[[nodiscard]] FOUNDATION_API std::string to_native_bytes(std::u16string_view name);

/// The UTF-16 form of the bytes of a file name or path, which need not be UTF-8.
///
/// Meaning: valid UTF-8 is decoded. Every byte that takes no part in valid UTF-8, and every byte of an encoded U+EF80
/// to U+EFFF, becomes U+EF00 + byte. So `to_native_bytes(from_native_bytes(bytes)) == bytes` for all bytes. Cost: one
/// pass and one allocation for a path of ordinary length.
[[nodiscard]] FOUNDATION_API std::u16string from_native_bytes(std::string_view bytes);

} // namespace fl::filesystem
