#include <foundation/network/IRI.hpp>

#include <foundation/network/IRIArgs.hpp>
#include <foundation/network/detail/characters.hpp>
#include <foundation/network/detail/dotSegments.hpp>
#include <foundation/network/wide.hpp>

#include <algorithm>
#include <stdexcept>
#include <utility>

namespace foundation::network {

namespace {

bool isIPLiteral(std::wstring_view host)
{
    return host.size() > 2 && host.front() == L'[' && host.back() == L']';
}

void appendHost(std::u16string& text, std::wstring_view host)
{
    if (!isIPLiteral(host)) {
        detail::appendEncoded(text, host, detail::inHost);
        return;
    }
    text += u'[';
    detail::appendEncoded(text, host.substr(1, host.size() - 2), detail::inIPLiteral);
    text += u']';
}

void appendAuthority(std::u16string& text, IRIArgs const& args)
{
    text += u"//";
    if (args.hasUserInfo) {
        detail::appendEncoded(text, args.userInfo, detail::inUserInfo);
        text += u'@';
    }
    if (args.hasHost)
        appendHost(text, args.host);
    if (args.hasPort) {
        text += u':';
        for (char const digit : std::to_string(args.port))
            text += static_cast<char16_t>(digit);
    }
}

std::u16string writtenPath(IRIArgs const& args)
{
    if (!args.hasPath)
        return {};
    if (args.pathIsEncoded) {
        std::u16string const path = fromWide(args.path);
        return detail::encodeImpossible(path, detail::classesOf(path));
    }
    std::u16string path;
    path.reserve(args.path.size());
    detail::appendEncoded(path, args.path, detail::inPath);
    return path;
}

/// Without an authority, "//" at the start of a path would begin one.
void escapeLeadingSlashes(std::u16string& path)
{
    if (path.starts_with(u"//"))
        path.replace(1, 1, u"%2F");
}

/// Without a scheme, a ':' in the first segment of a path would end one.
void escapeFirstSegment(std::u16string& path)
{
    constexpr std::u16string_view escape = u"%3A";
    for (std::size_t i = 0; i < path.size() && path[i] != u'/'; ++i) {
        if (path[i] == u':')
            path.replace(i, 1, escape);
    }
}

/// Appends a written path so that it is read as one again.
void appendPath(std::u16string& text, std::u16string path, bool hasScheme, bool hasAuthority)
{
    if (hasAuthority && !path.empty() && path.front() != u'/')
        throw std::invalid_argument("The path of an IRI with an authority must begin with a '/'.");
    if (!hasAuthority)
        escapeLeadingSlashes(path);
    if (!hasAuthority && !hasScheme)
        escapeFirstSegment(path);
    text += path;
}

void appendQueryAndFragment(std::u16string& text, IRIArgs const& args)
{
    if (args.hasQuery)
        detail::appendEncoded(text += u'?', args.query, detail::inQuery);
    if (args.hasFragment)
        detail::appendEncoded(text += u'#', args.fragment, detail::inFragment);
}

std::u16string writtenForm(IRIArgs const& args)
{
    std::u16string text;
    text.reserve(args.scheme.size() + args.host.size() + args.path.size() + 16);
    if (args.hasScheme)
        text.append(fromWide(args.scheme)) += u':';
    bool const hasAuthority = args.hasHost || args.hasUserInfo || args.hasPort;
    if (hasAuthority)
        appendAuthority(text, args);
    appendPath(text, writtenPath(args), args.hasScheme, hasAuthority);
    appendQueryAndFragment(text, args);
    return text;
}

std::u16string readAs(std::u16string_view part, iri::Encoding encoding)
{
    return encoding == iri::Encoding::Decoded ? detail::decodeEscapes(part) : std::u16string(part);
}

/// The part of a path up to its last '/', that included.
std::u16string_view folderOf(std::u16string_view path)
{
    return path.substr(0, path.rfind(u'/') + 1);
}

bool isRelative(std::u16string_view path)
{
    return !path.empty() && path.front() != u'/';
}

/// RFC 3986, section 5.2.3.
std::u16string merge(std::u16string_view basePath, bool baseHasAuthority, std::u16string_view path)
{
    std::u16string merged(basePath.empty() && baseHasAuthority ? std::u16string_view(u"/") : folderOf(basePath));
    return merged += path;
}

/// The path with "." and ".." segments written as escapes, which resolution does not remove (RFC 3986, section 5.2.4
/// looks at the text).
std::u16string keepDotSegments(std::u16string_view path)
{
    std::u16string result;
    result.reserve(path.size());
    while (true) {
        std::size_t const end = std::min(path.find(u'/'), path.size());
        std::u16string_view const segment = path.substr(0, end);
        result += segment == u"." ? u"%2E" : segment == u".." ? u"%2E%2E" : segment;
        if (end == path.size())
            return result;
        result += u'/';
        path.remove_prefix(end + 1);
    }
}

/// The written path that leads from `folder` to `path`; both begin with '/' and hold no dot segments, `folder` ends
/// with '/'. Empty when they are the same.
std::u16string relativePath(std::u16string_view folder, std::u16string_view path)
{
    std::size_t const limit = std::min(folder.size(), folderOf(path).size());
    auto const differ =
        std::mismatch(folder.begin(), folder.begin() + static_cast<std::ptrdiff_t>(limit), path.begin());
    std::size_t const same = static_cast<std::size_t>(differ.first - folder.begin());
    std::size_t const common = folder.substr(0, same).rfind(u'/') + 1;
    std::u16string result;
    for (auto up = std::count(folder.begin() + static_cast<std::ptrdiff_t>(common), folder.end(), u'/'); up > 0; --up)
        result += u"../";
    std::u16string_view const rest = path.substr(common);
    if (result.empty() && rest.starts_with(u'/'))
        result = u"./";
    return result += rest;
}

} // namespace

std::u16string iri::encodePath(std::u16string_view plain)
{
    std::u16string written;
    written.reserve(plain.size());
    detail::appendEncoded(written, toWide(plain), detail::inPath);
    return written;
}

IRI::IRI(std::u16string const& text) : IRI(std::u16string(text)) {}

IRI::IRI(std::u16string&& text) : IRI(std::move(text), detail::classesOf(text)) {}

IRI::IRI(IRIArgs const& args) : IRI(Written(), writtenForm(args)) {}

IRI::IRI(Written, std::u16string text) : text_(std::move(text)), layout_(detail::layOut(text_)) {}

IRI::IRI(std::u16string&& text, detail::CharacterClass present)
    : text_(detail::encodeImpossible(std::move(text), present)), layout_(detail::layOut(text_, present))
{}

bool IRI::isOpaque() const
{
    return isAbsolute() && !std::u16string_view(text_).substr(layout_.schemeEnd + 1).starts_with(u'/');
}

std::u16string IRI::getScheme() const
{
    return std::u16string(scheme());
}

std::u16string IRI::getHost(iri::Encoding const& encoding) const
{
    return readAs(part(layout_.host()), encoding);
}

std::u16string IRI::getPath(iri::Encoding const& encoding) const
{
    return readAs(path(), encoding);
}

std::u16string IRI::getSchemeSpecificPart(iri::Encoding const&) const
{
    return isAbsolute() ? text_.substr(layout_.schemeEnd + 1) : text_;
}

/// Puts written components together again (RFC 3986, section 5.3).
IRI IRI::assemble(IRI const& scheme, IRI const& authority, std::u16string path, IRI const& query) const
{
    std::u16string text;
    text.reserve(text_.size() + path.size() + authority.text_.size());
    if (scheme.isAbsolute())
        text.append(scheme.scheme()) += u':';
    if (authority.hasHost())
        text.append(u"//").append(authority.part(authority.layout_.authority()));
    appendPath(text, std::move(path), scheme.isAbsolute(), authority.hasHost());
    if (query.layout_.hasQuery)
        (text += u'?').append(query.part(query.layout_.query()));
    if (layout_.hasFragment)
        (text += u'#').append(part(layout_.fragment()));
    return IRI(Written(), std::move(text));
}

IRI IRI::resolveAgainst(IRI const& base) const
{
    bool const ownAuthority = isAbsolute() || hasHost();
    bool const ownPath = ownAuthority || !path().empty();
    std::u16string target;
    if (ownAuthority || path().starts_with(u'/'))
        target = detail::removeDotSegments(path());
    else if (ownPath)
        target = detail::removeDotSegments(merge(base.path(), base.hasHost(), path()));
    else
        target = base.path();
    return assemble(isAbsolute() ? *this : base, ownAuthority ? *this : base, std::move(target),
                    ownPath || layout_.hasQuery ? *this : base);
}

bool IRI::isReachableFrom(IRI const& base) const
{
    if (isRelative(path()) || isRelative(base.path()))
        return false;
    if (!isAbsolute() && !hasHost())
        return true;
    // A reference that has a path cannot lead to "s:".
    if (path().empty() && !hasHost())
        return false;
    return (!isAbsolute() || scheme() == base.scheme()) && hasHost() == base.hasHost() &&
           part(layout_.authority()) == base.part(base.layout_.authority());
}

IRI IRI::makeRelativeTo(IRI const& base) const
{
    static IRI const nothing{Written(), std::u16string()};
    if (!isAbsolute() && isRelative(path()))
        return *this;
    std::u16string target = keepDotSegments(path());
    if (!isReachableFrom(base))
        return assemble(*this, *this, std::move(target), *this);
    if (target.empty() && hasHost())
        return assemble(nothing, *this, std::move(target), *this);
    if (target.empty())
        target = u"/";
    if (base.path().empty() && !base.hasHost())
        return assemble(nothing, nothing, std::move(target), *this);
    std::u16string const folder = base.path().empty() ? u"/" : detail::removeDotSegments(folderOf(base.path()));
    std::u16string relative = relativePath(folder, target);
    // An empty reference stands for the base's path and query as they are written.
    if (relative.empty() && (path() != base.path() || (base.layout_.hasQuery && !layout_.hasQuery)))
        relative = u"./";
    return assemble(nothing, nothing, std::move(relative), *this);
}

IRI IRI::withoutTrailingSlash() const&
{
    return IRI(*this).withoutTrailingSlash();
}

IRI IRI::withoutTrailingSlash() &&
{
    if (path().size() < 2 || !path().ends_with(u'/'))
        return std::move(*this);
    text_.erase(layout_.path().end - 1, 1);
    return IRI(Written(), std::move(text_));
}

} // namespace foundation::network
