#include <tools/storage/printable.hpp>

#include <fl/filesystem/native_name.hpp>

#include <algorithm>
#include <fmt/format.h>
#include <iterator>

namespace foundation::storage::tool {

namespace {

bool isPlain(char c)
{
    return c >= ' ' && c <= '~' && c != '\\';
}

void appendOctal(std::string& text, std::string_view bytes)
{
    for (char const c : bytes)
        fmt::format_to(std::back_inserter(text), "\\{:03o}", static_cast<unsigned char>(c));
}

void appendASCII(std::string& text, char c)
{
    constexpr std::string_view named = "\a\b\t\n\v\f\r\\";
    constexpr std::string_view letters = "abtnvfr\\";
    if (auto const index = named.find(c); index != std::string_view::npos)
        text.append({'\\', letters[index]});
    else if (isPlain(c))
        text += c;
    else
        appendOctal(text, {&c, 1});
}

bool isByteOutsideUtf8(char16_t unit)
{
    return unit >= 0xEF80 && unit <= 0xEFFF;
}

/// C1 controls, line and paragraph separators, and the marks and embeddings of bidirectional text.
bool isObeyed(char16_t unit)
{
    return (unit >= 0x80 && unit <= 0x9F) || unit == 0x200E || unit == 0x200F || (unit >= 0x2028 && unit <= 0x202E) ||
           (unit >= 0x2066 && unit <= 0x2069);
}

bool isHighSurrogate(char16_t unit)
{
    return unit >= 0xD800 && unit <= 0xDBFF;
}

} // namespace

std::string printable(std::string_view bytes)
{
    if (std::all_of(bytes.begin(), bytes.end(), isPlain))
        return std::string(bytes);
    std::string text;
    std::u16string const units = fl::filesystem::from_native_bytes(bytes);
    for (std::size_t i = 0; i < units.size();) {
        std::size_t const count = isHighSurrogate(units[i]) ? 2 : 1;
        std::string const character = fl::filesystem::to_native_bytes(std::u16string_view(units).substr(i, count));
        if (units[i] < 0x80)
            appendASCII(text, character.front());
        else if (isByteOutsideUtf8(units[i]) || isObeyed(units[i]))
            appendOctal(text, character);
        else
            text += character;
        i += count;
    }
    return text;
}

} // namespace foundation::storage::tool
