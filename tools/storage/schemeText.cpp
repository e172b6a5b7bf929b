#include <tools/storage/schemeText.hpp>

#include <algorithm>

namespace foundation::storage::tool {

namespace {

constexpr std::string_view shortName = "7z";
constexpr std::string_view longName = "sevenzip";

bool isLetter(char c)
{
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
}

bool isSchemeCharacter(char c)
{
    return isLetter(c) || (c >= '0' && c <= '9') || c == '+' || c == '-' || c == '.';
}

std::string inLowerCase(std::string_view ascii)
{
    std::string text(ascii);
    for (char& c : text)
        c = c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    return text;
}

} // namespace

std::optional<std::size_t> schemeLength(std::string_view text)
{
    auto const end = std::find_if_not(text.begin(), text.end(), isSchemeCharacter);
    if (end == text.begin() || end == text.end() || *end != ':')
        return std::nullopt;
    std::size_t const length = static_cast<std::size_t>(end - text.begin());
    bool const isScheme = isLetter(text.front()) || inLowerCase(text.substr(0, length)) == shortName;
    return isScheme ? std::optional(length) : std::nullopt;
}

std::string withKnownSchemes(std::string_view iri)
{
    std::string known;
    while (auto const length = schemeLength(iri)) {
        std::string const scheme = inLowerCase(iri.substr(0, *length));
        known.append(scheme == shortName ? longName : scheme).append(1, ':');
        iri.remove_prefix(*length + 1);
    }
    return known.append(iri);
}

} // namespace foundation::storage::tool
