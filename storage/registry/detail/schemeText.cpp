#include <storage/registry/detail/schemeText.hpp>

#include <algorithm>

namespace foundation::storage::registry::detail {

namespace {

bool isUpper(char16_t c)
{
    return c >= u'A' && c <= u'Z';
}

bool isLetter(char16_t c)
{
    return isUpper(c) || (c >= u'a' && c <= u'z');
}

bool isSchemeCharacter(char16_t c)
{
    return isLetter(c) || (c >= u'0' && c <= u'9') || c == u'+' || c == u'-' || c == u'.';
}

} // namespace

bool isScheme(std::u16string_view text)
{
    return !text.empty() && isLetter(text.front()) && std::all_of(text.begin(), text.end(), isSchemeCharacter);
}

std::optional<std::u16string_view> schemeOf(std::u16string_view text)
{
    std::size_t const colon = text.find(u':');
    if (colon == std::u16string_view::npos || !isScheme(text.substr(0, colon)))
        return std::nullopt;
    return text.substr(0, colon);
}

std::u16string lowerCased(std::u16string_view scheme)
{
    std::u16string lower(scheme);
    for (char16_t& c : lower)
        c = isUpper(c) ? static_cast<char16_t>(c - u'A' + u'a') : c;
    return lower;
}

} // namespace foundation::storage::registry::detail
