#include <storage/local/detail/nativePath.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/detail/errorCode.hpp>

#include <algorithm>
#include <stdexcept>
#include <string_view>

namespace foundation::storage::local::detail {

namespace {

using provider::ErrorCode;
using provider::StorageIRI;

bool isLetter(char16_t unit, char16_t lower)
{
    return unit == lower || (unit >= u'A' && unit <= u'Z' && unit + (u'a' - u'A') == lower);
}

bool equalIgnoringCase(std::u16string_view text, std::u16string_view lower)
{
    return std::equal(text.begin(), text.end(), lower.begin(), lower.end(), isLetter);
}

/// Looks at the text, where what is absent costs nothing, rather than at the components.
bool namesThisMachine(std::u16string_view text)
{
    constexpr std::u16string_view scheme = u"file:";
    if (!equalIgnoringCase(text.substr(0, scheme.size()), scheme))
        return false;
    text.remove_prefix(scheme.size());
    if (std::any_of(text.begin(), text.end(), [](char16_t unit) { return unit == u'?' || unit == u'#'; }))
        return false;
    if (!text.starts_with(u"//"))
        return text.starts_with(u'/');
    text.remove_prefix(2);
    std::u16string_view const host = text.substr(0, text.find(u'/'));
    return host.empty() || equalIgnoringCase(host, u"localhost");
}

std::string toBytes(StorageIRI const& iri)
{
    try {
        return fl::filesystem::to_native_bytes(iri.getPath());
    } catch (std::range_error const&) {
        throwError(ErrorCode::InvalidLocation, iri);
    }
}

} // namespace

std::string nativePath(StorageIRI const& iri)
{
    if (!namesThisMachine(iri.toString()))
        throwError(ErrorCode::InvalidLocation, iri);
    std::string path = toBytes(iri);
    if (!path.starts_with('/') || path.find('\0') != std::string::npos)
        throwError(ErrorCode::InvalidLocation, iri);
    path.resize(std::max<std::size_t>(path.find_last_not_of('/') + 1, 1));
    return path;
}

std::string parentOf(std::string const& path)
{
    return path.substr(0, path.rfind('/') + 1);
}

std::string nameOf(std::string const& path)
{
    return path.substr(path.rfind('/') + 1);
}

} // namespace foundation::storage::local::detail
