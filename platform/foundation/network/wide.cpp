#include <foundation/network/wide.hpp>

#include <boost/regex/pending/unicode_iterator.hpp>

#include <algorithm>
#include <ios>
#include <sstream>
#include <stdexcept>

namespace foundation::network {

namespace {

std::wstring joinSurrogates(std::u16string const& text)
{
    using Iterator = boost::u16_to_u32_iterator<char16_t const*, wchar_t>;
    char16_t const* const begin = text.data();
    char16_t const* const end = begin + text.size();
    return std::wstring(Iterator(begin, begin, end), Iterator(end, begin, end));
}

} // namespace

std::wstring toWide(std::u16string_view text)
{
    if (std::any_of(text.begin(), text.end(), isSurrogate))
        return joinSurrogates(std::u16string(text));
    return std::wstring(text.begin(), text.end());
}

void requireScalarValue(char32_t codePoint)
{
    if (codePoint <= 0x10FFFF && !isSurrogate(codePoint))
        return;
    std::ostringstream message;
    message << "Invalid UTF-32 code point U+" << std::showbase << std::hex << static_cast<std::uint32_t>(codePoint)
            << " encountered while trying to encode UTF-16 sequence";
    throw std::out_of_range(message.str());
}

std::u16string fromWide(std::wstring_view text)
{
    std::u16string result;
    result.reserve(text.size());
    for (wchar_t const unit : text) {
        char32_t const codePoint = static_cast<char32_t>(unit);
        requireScalarValue(codePoint);
        appendCodePoint(result, codePoint);
    }
    return result;
}

} // namespace foundation::network
