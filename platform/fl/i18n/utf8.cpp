#include <fl/i18n/utf8.hpp>

#include <stdexcept>
#include <string>

#include <fl/i18n/detail/transcode.hpp>

namespace fl::i18n {

namespace {

char32_t checked(detail::CodePoint const& codePoint, Malformed malformed, char const* message)
{
    if (codePoint.isValid) {
        return codePoint.value;
    }
    if (malformed == Malformed::Throw) {
        throw std::range_error(message);
    }
    return detail::replacementCharacter;
}

} // namespace

std::string to_utf8(std::u16string_view text, Malformed malformed)
{
    return detail::utf16_to_utf8(text, [malformed](detail::CodePoint const& next, char* out) {
        return detail::encode_utf8(checked(next, malformed, "The text holds a surrogate without its partner."), out);
    });
}

std::u16string from_utf8(std::string_view text, Malformed malformed)
{
    return detail::utf8_to_utf16(text, [malformed](detail::CodePoint const& next, std::string_view, char16_t* out) {
        return detail::encode_utf16(checked(next, malformed, "The text is not well-formed UTF-8."), out);
    });
}

} // namespace fl::i18n
