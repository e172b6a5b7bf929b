#include <fl/i18n/convert.hpp>

#include <unicode/ucnv.h>
#include <unicode/ucnv_cb.h>
#include <unicode/ucnv_err.h>

#include <cstdint>
#include <limits>
#include <memory>
#include <new>
#include <stdexcept>
#include <string_view>

#include <fl/i18n/utf8.hpp>

namespace fl::i18n {

namespace {

using Converter = std::unique_ptr<UConverter, decltype(&ucnv_close)>;

bool namesUtf8(std::string const& encoding)
{
    return ucnv_compareNames(encoding.c_str(), "UTF-8") == 0;
}

Converter openConverter(std::string const& encoding)
{
    UErrorCode status = U_ZERO_ERROR;
    Converter converter(ucnv_open(encoding.c_str(), &status), &ucnv_close);
    if (status == U_MEMORY_ALLOCATION_ERROR) {
        throw std::bad_alloc();
    }
    if (U_FAILURE(status)) {
        throw std::invalid_argument("The character encoding '" + encoding + "' is not known.");
    }
    return converter;
}

void checkName(std::string const& encoding)
{
    // ICU stops at a NUL.
    if (encoding.find('\0') != std::string::npos) {
        throw std::invalid_argument("The name of a character encoding holds a NUL.");
    }
}

// ICU's own callbacks skip characters that are not drawn (joiners, variation selectors), even where they are to stop.
// The failure that ICU reports stays as it is.
void U_CALLCONV refuseUnmappable(void const* /*context*/, UConverterFromUnicodeArgs* /*arguments*/,
                                 UChar const* /*units*/, std::int32_t /*length*/, UChar32 /*codePoint*/,
                                 UConverterCallbackReason /*reason*/, UErrorCode* /*status*/)
{}

void U_CALLCONV replaceUnmappable(void const* /*context*/, UConverterFromUnicodeArgs* arguments, UChar const* /*units*/,
                                  std::int32_t /*length*/, UChar32 /*codePoint*/, UConverterCallbackReason reason,
                                  UErrorCode* status)
{
    if (reason <= UCNV_IRREGULAR) {
        *status = U_ZERO_ERROR;
        ucnv_cbFromUWriteSub(arguments, 0, status);
    }
}

// ICU's own substitution writes a control character for some malformed bytes.
void U_CALLCONV replaceMalformed(void const* /*context*/, UConverterToUnicodeArgs* arguments, char const* /*bytes*/,
                                 std::int32_t /*length*/, UConverterCallbackReason reason, UErrorCode* status)
{
    if (reason <= UCNV_IRREGULAR) {
        UChar const replacement = u'\uFFFD';
        *status = U_ZERO_ERROR;
        ucnv_cbToUWriteUChars(arguments, &replacement, 1, 0, status);
    }
}

void throwOnFailure(UErrorCode status, std::string const& encoding)
{
    if (status == U_MEMORY_ALLOCATION_ERROR) {
        throw std::bad_alloc();
    }
    if (U_FAILURE(status)) {
        throw std::range_error("The text cannot be converted with the character encoding '" + encoding + "'.");
    }
}

std::int32_t checkedLength(std::size_t length)
{
    // The worst encodings take eight bytes for a character, and ICU counts in 32 bits.
    if (length > static_cast<std::size_t>(std::numeric_limits<std::int32_t>::max()) / 16) {
        throw std::length_error("The text is too long for a character conversion.");
    }
    return static_cast<std::int32_t>(length);
}

std::string encode(std::u16string const& text, detail::Codec const& codec)
{
    Converter const converter = openConverter(codec.encoding());
    UErrorCode status = U_ZERO_ERROR;
    auto const onUnmappable = codec.isStrict() ? refuseUnmappable : replaceUnmappable;
    ucnv_setFromUCallBack(converter.get(), onUnmappable, nullptr, nullptr, nullptr, &status);
    auto const length = checkedLength(text.size());
    std::string result(
        static_cast<std::size_t>(UCNV_GET_MAX_BYTES_FOR_STRING(length, ucnv_getMaxCharSize(converter.get()))), '\0');
    auto const written = ucnv_fromUChars(converter.get(), result.data(), static_cast<std::int32_t>(result.size()),
                                         text.data(), length, &status);
    throwOnFailure(status, codec.encoding());
    result.resize(static_cast<std::size_t>(written));
    return result;
}

std::u16string decode(std::string const& text, detail::Codec const& codec)
{
    Converter const converter = openConverter(codec.encoding());
    UErrorCode status = U_ZERO_ERROR;
    auto const onMalformed = codec.isStrict() ? UCNV_TO_U_CALLBACK_STOP : replaceMalformed;
    ucnv_setToUCallBack(converter.get(), onMalformed, nullptr, nullptr, nullptr, &status);
    auto const length = checkedLength(text.size());
    std::u16string result(text.size() * 2 + 1, u'\0');
    auto const written = ucnv_toUChars(converter.get(), result.data(), static_cast<std::int32_t>(result.size()),
                                       text.data(), length, &status);
    throwOnFailure(status, codec.encoding());
    result.resize(static_cast<std::size_t>(written));
    return result;
}

Malformed malformedPolicy(detail::Codec const& codec)
{
    return codec.isStrict() ? Malformed::Throw : Malformed::Replace;
}

} // namespace

namespace detail {

Codec::Codec(std::string const& encoding, bool strict)
    : encoding_(encoding), isUtf8_(namesUtf8(encoding)), isStrict_(strict)
{
    checkName(encoding);
    if (!isUtf8_) {
        static_cast<void>(openConverter(encoding));
    }
}

} // namespace detail

codecvt_ustring_to_string::codecvt_ustring_to_string(std::string const& encoding, bool strict) : Codec(encoding, strict)
{}

codecvt_string_to_ustring::codecvt_string_to_ustring(std::string const& encoding, bool strict) : Codec(encoding, strict)
{}

std::string to_string(std::u16string const& text, codecvt_ustring_to_string const& converter)
{
    return converter.isUtf8() ? to_utf8(text, malformedPolicy(converter)) : encode(text, converter);
}

std::string to_string(std::u16string const& text)
{
    return to_utf8(text, Malformed::Throw);
}

std::u16string to_ustring(std::string const& text, codecvt_string_to_ustring const& converter)
{
    return converter.isUtf8() ? from_utf8(text, malformedPolicy(converter)) : decode(text, converter);
}

std::u16string to_ustring(std::string const& text)
{
    return from_utf8(text, Malformed::Throw);
}

} // namespace fl::i18n
