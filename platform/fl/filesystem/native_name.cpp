#include <fl/filesystem/native_name.hpp>

#include <stdexcept>

#include <fl/i18n/detail/transcode.hpp>

namespace fl::filesystem {

namespace {

using fl::i18n::detail::CodePoint;

constexpr char32_t byteBase = 0xEF00;

// Only bytes beyond ASCII ever need a stand-in: no other byte is malformed UTF-8.
bool standsForByte(char32_t codePoint)
{
    return codePoint >= byteBase + 0x80 && codePoint <= byteBase + 0xFF;
}

char* putBytes(CodePoint const& next, char* out)
{
    if (!next.isValid) {
        throw std::range_error("A file name cannot hold a surrogate without its partner.");
    }
    if (standsForByte(next.value)) {
        *out++ = static_cast<char>(static_cast<unsigned char>(next.value - byteBase));
        return out;
    }
    return fl::i18n::detail::encode_utf8(next.value, out);
}

char16_t* putUnits(CodePoint const& next, std::string_view bytes, char16_t* out)
{
    if (next.isValid && !standsForByte(next.value)) {
        return fl::i18n::detail::encode_utf16(next.value, out);
    }
    for (char const byte : bytes) {
        *out++ = static_cast<char16_t>(byteBase + static_cast<unsigned char>(byte));
    }
    return out;
}

} // namespace

std::string to_native_bytes(std::u16string_view name)
{
    return fl::i18n::detail::utf16_to_utf8(name, putBytes);
}

std::u16string from_native_bytes(std::string_view bytes)
{
    return fl::i18n::detail::utf8_to_utf16(bytes, putUnits);
}

} // namespace fl::filesystem
