#include <foundation/ustring.hpp>

#include <ostream>
#include <stdexcept>

#include <fl/i18n/detail/transcode.hpp>
#include <fl/i18n/utf8.hpp>

namespace foundation::ustring {

std::ostream& insert(std::ostream& stream, std::u16string_view text)
{
    return stream << fl::i18n::to_utf8(text, fl::i18n::Malformed::Replace);
}

std::u16string transform(std::u16string text, char32_t (*change)(char32_t))
{
    std::u16string result;
    result.reserve(text.size());
    for (std::u16string_view rest = text; !rest.empty();) {
        auto const next = fl::i18n::detail::decode_utf16(rest);
        char32_t const changed = change(next.value);
        if (changed > 0x10FFFF) {
            throw std::range_error("A code point lies beyond U+10FFFF.");
        }
        char16_t units[2];
        result.append(units, fl::i18n::detail::encode_utf16(changed, units));
        rest.remove_prefix(next.length);
    }
    return result;
}

} // namespace foundation::ustring
