#pragma once

#include <string_view>

#include <foundation/export.hpp>

namespace fl::filesystem {

/// Whether a file name matches a pattern, as a whole and with the case as written.
///
/// Meaning: `*` stands for any run of characters, also none; `?` for one character; `[abc]`, `[a-z]` for one of those
/// listed; `[!abc]` and `[^abc]` for one that is not listed. In brackets a `]` that comes first and a `-` that comes
/// first or last stand for themselves, as does everything else but a range; so `[*]` matches a star. A `[` that no `]`
/// closes stands for itself. A character is a code point; a surrogate that is not part of a pair is one, too. Nothing
/// else is special, be it a leading dot, a backslash or a `/`.
/// Cost: no allocation; at worst the product of both lengths, whatever the number of stars.
/// Source: POSIX.1-2017, section 2.13 of the Shell Command Language, without classes, collation and escapes.
[[nodiscard]] FOUNDATION_API bool matches_wildcards(std::u16string_view name, std::u16string_view pattern);

} // namespace fl::filesystem
