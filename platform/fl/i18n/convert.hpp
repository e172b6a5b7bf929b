#pragma once

#include <string>

#include <foundation/export.hpp>

namespace fl::i18n {

namespace detail {

/// A character encoding by name, and whether malformed text is refused.
class FOUNDATION_API Codec
{
public:
    [[nodiscard]] std::string const& encoding() const noexcept { return encoding_; }
    [[nodiscard]] bool isUtf8() const noexcept { return isUtf8_; }
    [[nodiscard]] bool isStrict() const noexcept { return isStrict_; }

protected:
    Codec(std::string const& encoding, bool strict);

private:
    std::string encoding_;
    bool isUtf8_;
    bool isStrict_;
};

} // namespace detail

/// Converts UTF-16 to the encoding it names.
///
/// Meaning: "UTF-8" (also "UTF8", in any letter case) or any name that ICU knows, such as "IBM437". A strict converter
/// refuses what is malformed or has no form in the encoding; another puts the encoding's replacement in its place,
/// which is U+FFFD for UTF-8.
/// Errors: `std::invalid_argument` for an encoding that nobody knows.
/// Threads: any number of threads may use one converter.
class FOUNDATION_API codecvt_ustring_to_string : public detail::Codec
{
public:
    codecvt_ustring_to_string(std::string const& encoding, bool strict);
};

/// Converts text of the encoding it names to UTF-16.
///
/// Meaning: as `codecvt_ustring_to_string`; the replacement for malformed text is U+FFFD.
/// Errors: `std::invalid_argument` for an encoding that nobody knows.
/// Threads: any number of threads may use one converter.
class FOUNDATION_API codecvt_string_to_ustring : public detail::Codec
{
public:
    codecvt_string_to_ustring(std::string const& encoding, bool strict);
};

/// UTF-16 to the converter's encoding.
///
/// Errors: `std::range_error` when the converter is strict and the text malformed or not representable.
[[nodiscard]] FOUNDATION_API std::string to_string(std::u16string const& text,
                                                   codecvt_ustring_to_string const& converter);

/// UTF-16 to UTF-8.
///
/// Errors: `std::range_error` for a surrogate that is not part of a pair.
[[nodiscard]] FOUNDATION_API std::string to_string(std::u16string const& text);

/// Text of the converter's encoding to UTF-16.
///
/// Errors: `std::range_error` when the converter is strict and the text malformed.
[[nodiscard]] FOUNDATION_API std::u16string to_ustring(std::string const& text,
                                                       codecvt_string_to_ustring const& converter);

/// UTF-8 to UTF-16.
///
/// Errors: `std::range_error` for malformed text.
[[nodiscard]] FOUNDATION_API std::u16string to_ustring(std::string const& text);

} // namespace fl::i18n
