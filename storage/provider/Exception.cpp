#include <storage/provider/Exception.hpp>

#include <fl/i18n/convert.hpp>
#include <storage/provider/detail/exceptionText.hpp>

namespace foundation::storage::provider {

namespace {

constexpr char const* className = "foundation::storage::provider::Exception";

} // namespace

Exception::Exception(ErrorCode const& code, StorageIRI const& location)
{
    *this << ErrorCodeInfo(code) << StorageIRIInfo(location);
}

ErrorCode Exception::getErrorCode() const
{
    return detail::requireInfo<ErrorCodeInfo>(*this);
}

StorageIRI Exception::getStorageIRI() const
{
    return detail::requireInfo<StorageIRIInfo>(*this);
}

core::except::IException* Exception::clone() const
{
    return new Exception(*this);
}

void Exception::rethrow() const
{
    throw Exception(*this);
}

char const* Exception::what() const noexcept
{
    return className;
}

std::u16string Exception::ToUstringImpl() const
{
    std::u16string const code = fl::i18n::to_ustring(toString(getErrorCode()));
    return detail::diagnosticText(className, getStorageIRI(), u"\", ErrorCode=\"" + code + u"\"}");
}

std::u16string detail::diagnosticText(char const* name, StorageIRI const& location, std::u16string_view rest)
{
    return fl::i18n::to_ustring(name).append(u"{StorageIRI=\"").append(location.toString()).append(rest);
}

} // namespace foundation::storage::provider
