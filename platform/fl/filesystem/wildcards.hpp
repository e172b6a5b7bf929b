#pragma once

#include <memory>
#include <string_view>

#include <foundation/export.hpp>

namespace fl::filesystem {

/// Whether a capital letter is another letter than the small one.
enum class LetterCase
{
    Matters,
    Ignored,
};

/// A pattern for names of files, made ready for many of them.
///
/// Meaning: `*` stands for any run of characters, also none; `?` for one character; `[abc]`, `[a-z]` for one of those
/// listed; `[!abc]` and `[^abc]` for one that is not listed. In brackets a `]` that comes first and a `-` that comes
/// first or last stand for themselves, as does everything else but a range; so `[*]` matches a star, and there are no
/// classes such as `[:digit:]`. A range from a later to an earlier character is empty. A `[` that no `]` closes stands
/// for itself: every text is a pattern. A character is a code point; a surrogate that is not part of a pair is one,
/// too. Nothing else is special, be it a leading dot or a backslash. A `/`, which no name holds, is matched by itself
/// alone.
///
/// Source: POSIX.1-2017, section 2.13 of the Shell Command Language, without classes, collation and escapes.
/// Ownership: copies share what was made ready.
/// Threads: any number at once.
/// Cost: some microseconds to make; a match takes at worst the product of both lengths, whatever the number of stars.
/// It allocates nothing for a name of at most 255 code units, but for the first name in each thread.
class FOUNDATION_API Wildcards
{
public:
    /// Throws `std::bad_alloc`; no pattern is malformed.
    explicit Wildcards(std::u16string_view pattern, LetterCase letter_case = LetterCase::Matters);

    /// Whether the pattern matches the name as a whole.
    [[nodiscard]] bool matches(std::u16string_view name) const;

private:
    class Program;

    std::shared_ptr<Program const> program_;
};

} // namespace fl::filesystem
