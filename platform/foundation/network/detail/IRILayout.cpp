#include <foundation/network/detail/IRILayout.hpp>

#include <foundation/network/detail/characters.hpp>
#include <foundation/ustring.hpp>

#include <algorithm>
#include <cstdint>
#include <limits>
#include <sstream>
#include <stdexcept>

namespace foundation::network::detail {

namespace {

/// The first position from `begin` on whose character is of a class in `classes`, or the end of the text.
std::size_t findClass(std::u16string_view text, std::size_t begin, CharacterClass classes)
{
    while (begin != text.size() && !isOf(text[begin], classes))
        ++begin;
    return begin;
}

std::size_t schemeEnd(std::u16string_view text)
{
    if (text.empty() || !isOf(text.front(), alpha))
        return 0;
    std::size_t end = 1;
    while (end != text.size() && isOf(text[end], schemeCharacter))
        ++end;
    return end != text.size() && text[end] == u':' ? end : 0;
}

bool allDigits(std::u16string_view text)
{
    return std::all_of(text.begin(), text.end(), [](char16_t c) { return c >= u'0' && c <= u'9'; });
}

/// Where the ':' before the port stands, or the end of the authority. An IP literal holds ':' of its own; what follows
/// a ':' and is no number belongs to the host.
std::size_t portColon(std::u16string_view text, Span hostAndPort)
{
    std::u16string_view const part = text.substr(hostAndPort.begin, hostAndPort.size());
    std::size_t const colon = part.rfind(u':');
    std::size_t const bracket = part.rfind(u']');
    if (colon == std::u16string_view::npos || (bracket != std::u16string_view::npos && colon < bracket) ||
        !allDigits(part.substr(colon + 1)))
        return hostAndPort.end;
    return hostAndPort.begin + colon;
}

void checkPort(std::u16string_view text, Span port)
{
    std::u16string_view digits = text.substr(port.begin, port.size());
    digits.remove_prefix(std::min(digits.find_first_not_of(u'0'), digits.size()));
    if (digits.size() > 5 || portNumber(digits) > std::numeric_limits<std::uint16_t>::max()) {
        std::ostringstream message;
        ustring::insert(message << "The port of the IRI '", text) << "' is beyond 65535.";
        throw std::invalid_argument(message.str());
    }
}

void layOutAuthority(std::u16string_view text, IRILayout& layout)
{
    Span rest = layout.authority();
    std::size_t const at = text.substr(rest.begin, rest.size()).rfind(u'@');
    if (at != std::u16string_view::npos) {
        layout.hasUserInfo = true;
        rest.begin += at + 1;
    }
    layout.hostBegin = rest.begin;
    layout.hostEnd = portColon(text, rest);
    if (layout.hasPort())
        checkPort(text, layout.port());
}

} // namespace

unsigned portNumber(std::u16string_view digits)
{
    unsigned number = 0;
    for (char16_t const digit : digits)
        number = number * 10 + (digit - u'0');
    return number;
}

IRILayout layOut(std::u16string_view text, CharacterClass present)
{
    IRILayout layout;
    layout.schemeEnd = schemeEnd(text);
    std::size_t const begin = layout.hasScheme() ? layout.schemeEnd + 1 : 0;
    layout.authorityBegin = layout.hostBegin = layout.hostEnd = layout.pathBegin = begin;
    if (text.substr(begin).starts_with(u"//")) {
        layout.hasAuthority = true;
        layout.authorityBegin = begin + 2;
        layout.pathBegin = findClass(text, begin + 2, endsAuthority);
        layOutAuthority(text, layout);
    }
    layout.pathEnd = (present & endsPath) != 0 ? findClass(text, layout.pathBegin, endsPath) : text.size();
    layout.hasQuery = layout.pathEnd != text.size() && text[layout.pathEnd] == u'?';
    layout.queryEnd = layout.hasQuery ? std::min(text.find(u'#', layout.pathEnd), text.size()) : layout.pathEnd;
    layout.hasFragment = layout.queryEnd != text.size();
    layout.textEnd = text.size();
    return layout;
}

} // namespace foundation::network::detail
