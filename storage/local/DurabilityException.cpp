#include <storage/local/DurabilityException.hpp>

#include <fl/i18n/convert.hpp>
#include <storage/provider/ReasonInfo.hpp>

namespace foundation::storage::local {

using namespace provider;

namespace {

constexpr char const* className = "foundation::storage::local::DurabilityException";
constexpr char16_t const* meaning = u"The new content is in place, but it is not certain to survive a power failure.";
constexpr char16_t const* reason = u"the new content is in place, but it is not certain to survive a power failure";

} // namespace

DurabilityException::DurabilityException(ErrorCode const& code, StorageIRI const& target) : Exception(code, target)
{
    *this << ReasonInfo(reason);
}

core::except::IException* DurabilityException::clone() const
{
    return new DurabilityException(*this);
}

void DurabilityException::rethrow() const
{
    throw DurabilityException(*this);
}

char const* DurabilityException::what() const noexcept
{
    return className;
}

std::u16string DurabilityException::ToUstringImpl() const
{
    return convert_str(std::string(className)) + u"{StorageIRI=\"" + getStorageIRI().toString() + u"\", ErrorCode=\"" +
           fl::i18n::to_ustring(toString(getErrorCode())) + u"\"}: " + meaning;
}

} // namespace foundation::storage::local
