#include <fl/filesystem/wildcards.hpp>

#include <cstddef>
#include <optional>

namespace fl::filesystem {

namespace {

using view = std::u16string_view;

bool is_pair(view text, std::size_t at)
{
    return at + 1 < text.size() && (text[at] & 0xFC00) == 0xD800 && (text[at + 1] & 0xFC00) == 0xDC00;
}

/// The code point at a position, which moves behind it.
char32_t take(view text, std::size_t& at)
{
    if (!is_pair(text, at))
        return text[at++];
    char32_t const high = text[at] & 0x3FFu;
    char32_t const low = text[at + 1] & 0x3FFu;
    at += 2;
    return 0x10000 + (high << 10 | low);
}

bool is_negation(view pattern, std::size_t at)
{
    return at < pattern.size() && (pattern[at] == u'!' || pattern[at] == u'^');
}

/// Where the bracket that opens before `at` is closed: not by a `]` that comes first.
std::size_t find_closing(view pattern, std::size_t at)
{
    return pattern.find(u']', at + (is_negation(pattern, at) ? 2 : 1));
}

/// Whether a bracket, given without its ends, lists a character.
bool lists(view list, char32_t character)
{
    bool const negated = is_negation(list, 0);
    bool found = false;
    for (std::size_t at = negated ? 1 : 0; at < list.size();) {
        char32_t const first = take(list, at);
        char32_t last = first;
        if (at + 1 < list.size() && list[at] == u'-')
            last = take(list, ++at);
        found = found || (first <= character && character <= last);
    }
    return found != negated;
}

/// Matches one character against what stands in the pattern, a star apart. Answers where the pattern goes on.
std::optional<std::size_t> match_one(view pattern, std::size_t at, char32_t character)
{
    char32_t const wanted = take(pattern, at);
    if (wanted == U'[') {
        std::size_t const closing = find_closing(pattern, at);
        if (closing != view::npos)
            return lists(pattern.substr(at, closing - at), character) ? std::optional(closing + 1) : std::nullopt;
    }
    return wanted == U'?' || wanted == character ? std::optional(at) : std::nullopt;
}

} // namespace

bool matches_wildcards(view name, view pattern)
{
    // Only the last star needs a second attempt: what an earlier one could still take, the last one can take as well.
    std::size_t star = view::npos;
    std::size_t taken = 0;
    std::size_t at = 0;
    for (std::size_t position = 0; position < name.size();) {
        if (at < pattern.size() && pattern[at] == u'*') {
            star = ++at;
            taken = position;
            continue;
        }
        std::size_t next = position;
        char32_t const character = take(name, next);
        if (auto const matched = at < pattern.size() ? match_one(pattern, at, character) : std::nullopt) {
            at = *matched;
            position = next;
        } else if (star == view::npos) {
            return false;
        } else {
            take(name, taken);
            position = taken;
            at = star;
        }
    }
    return pattern.find_first_not_of(u'*', at) == view::npos;
}

} // namespace fl::filesystem
