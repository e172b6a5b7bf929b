#include <storage/registry/redactPassword.hpp>

#include <algorithm>
#include <optional>

namespace foundation::storage::registry {

namespace {

using Text = std::u16string_view;

/// A part of a text.
struct Span
{
    std::size_t begin;
    std::size_t end;
};

/// A delimiter as it stands in a text, and as an escape in either case of letters.
struct Delimiter
{
    Text plain;
    Text upperEscape;
    Text lowerEscape;
};

constexpr Delimiter colon{u":", u"%3A", u"%3a"};
constexpr Delimiter at{u"@", u"%40", u"%40"};

bool isAt(Text text, std::size_t position, Text wanted)
{
    return text.substr(position, wanted.size()) == wanted;
}

std::optional<Span> delimiterAt(Text text, std::size_t position, Delimiter const& delimiter)
{
    for (Text const written : {delimiter.plain, delimiter.upperEscape, delimiter.lowerEscape}) {
        if (isAt(text, position, written))
            return Span{position, position + written.size()};
    }
    return std::nullopt;
}

std::optional<Span> findFirst(Text text, Delimiter const& delimiter)
{
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (auto const found = delimiterAt(text, i, delimiter))
            return found;
    }
    return std::nullopt;
}

std::optional<Span> findLast(Text text, Delimiter const& delimiter)
{
    for (std::size_t i = text.size(); i > 0; --i) {
        if (auto const found = delimiterAt(text, i - 1, delimiter))
            return found;
    }
    return std::nullopt;
}

/// Digits of a port, to which the '!' of a container puts an end.
bool isPort(Text text)
{
    text = text.substr(0, text.find(u'!'));
    return text.size() <= 5 && std::all_of(text.begin(), text.end(), [](char16_t c) { return c >= u'0' && c <= u'9'; });
}

/// What stands where a password does, behind the first ':' outside the brackets of an address.
std::optional<std::size_t> beginOfPassword(Text userAndHost)
{
    std::size_t const bracket = userAndHost.starts_with(u'[') ? userAndHost.find(u']') : 0;
    if (bracket == Text::npos)
        return std::nullopt;
    auto const found = findFirst(userAndHost.substr(bracket), colon);
    return found ? std::optional(bracket + found->end) : std::nullopt;
}

/// In what follows the "//" before an authority.
std::optional<Span> findPasswordBehindSlashes(Text text)
{
    Text const authority = text.substr(0, text.find_first_of(u"/?#"));
    if (auto const end = findLast(authority, at)) {
        auto const separator = findFirst(authority.substr(0, end->begin), colon);
        return separator ? std::optional(Span{separator->end, end->begin}) : std::nullopt;
    }
    auto const begin = beginOfPassword(authority);
    std::size_t const end = text.rfind(u'@');
    if (!begin || end == Text::npos || isPort(authority.substr(*begin)))
        return std::nullopt;
    return Span{*begin, end};
}

/// The authority is behind the first '/' of all, should two of them stand there: what comes before are schemes.
std::optional<Span> findPassword(Text text)
{
    std::size_t const slash = text.find(u'/');
    if (slash == Text::npos || !isAt(text, slash, u"//"))
        return std::nullopt;
    std::size_t const begin = slash + 2;
    auto const found = findPasswordBehindSlashes(text.substr(begin));
    if (!found || found->begin == found->end)
        return std::nullopt;
    return Span{begin + found->begin, begin + found->end};
}

} // namespace

bool hasPassword(Text location)
{
    return findPassword(location).has_value();
}

std::u16string redactPassword(std::u16string location)
{
    if (auto const found = findPassword(location))
        location.replace(found->begin, found->end - found->begin, u"***");
    return location;
}

} // namespace foundation::storage::registry
