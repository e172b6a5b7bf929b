#include <storage/archive/detail/zipText.hpp>

#include <fl/filesystem/native_name.hpp>
#include <fl/i18n/utf8.hpp>

#include <algorithm>
#include <stdexcept>

namespace foundation::storage::archive::detail {

namespace {

/// The upper half of code page 437.
constexpr std::u16string_view upperHalf = u"ÇüéâäàåçêëèïîìÄÅÉæÆôöòûùÿÖÜ¢£¥₧ƒáíóúñÑªº¿⌐¬½¼¡«»░▒▓│┤╡╢╖╕╣║╗╝╜╛┐"
                                          u"└┴┬├─┼╞╟╚╔╩╦╠═╬╧╨╤╥╙╘╒╓╫╪┘┌█▄▌▐▀αßΓπΣσµτΦΘΩδ∞φε∩≡±≥≤⌠⌡÷≈°∙·√ⁿ²■\u00A0";
static_assert(upperHalf.size() == 128);

char16_t fromCodePage437(char byte)
{
    auto const code = static_cast<unsigned char>(byte);
    return code < 128 ? code : upperHalf[code - 128u];
}

bool standsForByte(char16_t unit)
{
    return unit >= 0xEF80 && unit <= 0xEFFF;
}

bool isUtf8(std::string_view bytes)
{
    try {
        static_cast<void>(fl::i18n::from_utf8(bytes, fl::i18n::Malformed::Throw));
        return true;
    } catch (std::range_error const&) {
        return false;
    }
}

} // namespace

/// UTF-8 may hold a character that stands for a byte elsewhere; its bytes then have stand-ins of their own.
std::u16string fromZipText(std::string_view bytes)
{
    std::u16string text = fl::filesystem::from_native_bytes(bytes);
    if (std::none_of(text.begin(), text.end(), standsForByte) || isUtf8(bytes))
        return text;
    text.resize(bytes.size());
    std::transform(bytes.begin(), bytes.end(), text.begin(), fromCodePage437);
    return text;
}

} // namespace foundation::storage::archive::detail
