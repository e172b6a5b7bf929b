#include <fl/filesystem/wildcards.hpp>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <new>
#include <stdexcept>
#include <string>

#include <fl/i18n/detail/transcode.hpp>

// Characters of 32 bits, which need not be Unicode: so one is a code point, a surrogate without its partner as well.
#define PCRE2_CODE_UNIT_WIDTH 32
#include <pcre2.h>

namespace fl::filesystem {

namespace {

template <auto release>
struct Releasing
{
    template <typename T>
    void operator()(T* held) const
    {
        release(held);
    }
};

using Code = std::unique_ptr<pcre2_code, Releasing<pcre2_code_free>>;
using MatchData = std::unique_ptr<pcre2_match_data, Releasing<pcre2_match_data_free>>;

/// No pattern is wrong: what fails here is memory, or the name is longer than any limit.
[[noreturn]] void throw_failure(int error)
{
    if (error == PCRE2_ERROR_NOMEMORY)
        throw std::bad_alloc();
    std::array<PCRE2_UCHAR, 256> message{};
    pcre2_get_error_message(error, message.data(), message.size());
    auto const end = std::find(message.begin(), message.end(), 0u);
    throw std::runtime_error("A pattern cannot be used: " + std::string(message.begin(), end));
}

char32_t* write_code_points(std::u16string_view text, char32_t* out)
{
    while (!text.empty()) {
        auto const next = i18n::detail::decode_utf16(text);
        *out++ = next.value;
        text.remove_prefix(next.length);
    }
    return out;
}

std::u32string code_points(std::u16string_view text)
{
    std::u32string result(text.size(), U'\0');
    result.resize(static_cast<std::size_t>(write_code_points(text, result.data()) - result.data()));
    return result;
}

bool is_negation(std::u32string_view pattern, std::size_t at)
{
    return at < pattern.size() && (pattern[at] == U'!' || pattern[at] == U'^');
}

/// Where the bracket that opens before `at` is closed: not by a `]` that comes first.
std::size_t find_closing(std::u32string_view pattern, std::size_t at)
{
    return pattern.find(U']', at + (is_negation(pattern, at) ? 2 : 1));
}

/// A backslash takes its meaning from whatever is neither a letter nor a digit.
std::u32string literal(char32_t character)
{
    bool const isPlain = (character >= U'0' && character <= U'9') || (character >= U'A' && character <= U'Z') ||
                         (character >= U'a' && character <= U'z');
    return isPlain ? std::u32string{character} : std::u32string{U'\\', character};
}

/// What a bracket lists, given without its ends and its negation. Empty ranges, which PCRE2 refuses, are left out.
std::u32string translate_list(std::u32string_view list)
{
    std::u32string result;
    while (!list.empty()) {
        bool const isRange = list.size() > 2 && list[1] == U'-';
        char32_t const first = list[0];
        char32_t const last = list[isRange ? 2 : 0];
        list.remove_prefix(isRange ? 3 : 1);
        if (first <= last)
            result += literal(first) + U'-' + literal(last);
    }
    return result;
}

std::u32string translate_bracket(std::u32string_view content)
{
    bool const isNegated = is_negation(content, 0);
    std::u32string const list = translate_list(content.substr(isNegated ? 1 : 0));
    if (list.empty())
        return isNegated ? U"." : U"(*FAIL)";
    return (isNegated ? U"[^" : U"[") + list + U']';
}

/// The pattern as a regular expression.
///
/// Written here, because what PCRE2 itself makes of patterns (up to 10.42) is wrong for brackets such as "[!a]" and
/// "[:a:]". What stands between two stars need not be tried at another place than the first where it fits, which
/// `(*COMMIT)` says: so no number of stars makes a match slow.
std::u32string translate(std::u32string_view pattern)
{
    std::u32string result = U"\\A";
    for (std::size_t at = 0; at < pattern.size(); ++at) {
        char32_t const character = pattern[at];
        std::size_t const closing = character == U'[' ? find_closing(pattern, at + 1) : pattern.npos;
        if (closing != pattern.npos) {
            result += translate_bracket(pattern.substr(at + 1, closing - at - 1));
            at = closing;
        } else if (character == U'*') {
            result += U"(*COMMIT).*?";
        } else {
            result += character == U'?' ? U"." : literal(character);
        }
    }
    return result + U"\\z";
}

PCRE2_SPTR units_of(char32_t const* text)
{
    static_assert(sizeof(PCRE2_UCHAR) == sizeof(char32_t));
    return reinterpret_cast<PCRE2_SPTR>(text);
}

Code compile(std::u32string const& expression, LetterCase letter_case)
{
    std::uint32_t const options = letter_case == LetterCase::Ignored ? PCRE2_CASELESS | PCRE2_UCP : 0;
    int error = 0;
    PCRE2_SIZE offset = 0;
    Code code(pcre2_compile(units_of(expression.data()), expression.size(), PCRE2_DOTALL | options, &error, &offset,
                            nullptr));
    if (!code)
        throw_failure(error);
    // Where the system lets nobody make machine code, the expression is interpreted.
    pcre2_jit_compile(code.get(), PCRE2_JIT_COMPLETE);
    return code;
}

/// Working memory of this thread, for all its matches.
pcre2_match_data* match_data()
{
    thread_local MatchData const data(pcre2_match_data_create(1, nullptr));
    if (!data)
        throw std::bad_alloc();
    return data.get();
}

} // namespace

class Wildcards::Program
{
public:
    Program(std::u16string_view pattern, LetterCase letter_case)
        : code_(compile(translate(code_points(pattern)), letter_case))
    {}

    bool matches(char32_t const* name, std::size_t size) const
    {
        int result = match(name, size, 0);
        if (result == PCRE2_ERROR_JIT_STACKLIMIT)
            result = match(name, size, PCRE2_NO_JIT);
        if (result < 0 && result != PCRE2_ERROR_NOMATCH)
            throw_failure(result);
        return result >= 0;
    }

private:
    int match(char32_t const* name, std::size_t size, std::uint32_t options) const
    {
        return pcre2_match(code_.get(), units_of(name), size, 0, options, match_data(), nullptr);
    }

    Code code_;
};

Wildcards::Wildcards(std::u16string_view pattern, LetterCase letter_case)
    : program_(std::make_shared<Program const>(pattern, letter_case))
{}

bool Wildcards::matches(std::u16string_view name) const
{
    std::array<char32_t, 255> onStack;
    if (name.size() > onStack.size()) {
        std::u32string const characters = code_points(name);
        return program_->matches(characters.data(), characters.size());
    }
    char32_t const* const end = write_code_points(name, onStack.data());
    return program_->matches(onStack.data(), static_cast<std::size_t>(end - onStack.data()));
}

} // namespace fl::filesystem
