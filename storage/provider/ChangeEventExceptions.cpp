#include <storage/provider/ChangeEventExceptions.hpp>

#include <storage/provider/detail/exceptionText.hpp>

namespace foundation::storage::provider {

namespace {

constexpr char const* notSupported = "foundation::storage::provider::ChangeEventsNotSupportedException";
constexpr char const* subscription = "foundation::storage::provider::ChangeEventsSubscriptionException";

} // namespace

ChangeEventsNotSupportedException::ChangeEventsNotSupportedException(StorageIRI const& location)
{
    *this << StorageIRIInfo(location);
}

StorageIRI ChangeEventsNotSupportedException::getStorageIRI() const
{
    return detail::requireInfo<StorageIRIInfo>(*this);
}

core::except::IException* ChangeEventsNotSupportedException::clone() const
{
    return new ChangeEventsNotSupportedException(*this);
}

void ChangeEventsNotSupportedException::rethrow() const
{
    throw ChangeEventsNotSupportedException(*this);
}

char const* ChangeEventsNotSupportedException::what() const noexcept
{
    return notSupported;
}

std::u16string ChangeEventsNotSupportedException::ToUstringImpl() const
{
    return detail::diagnosticText(notSupported, getStorageIRI(), u"\"}");
}

ChangeEventsSubscriptionException::ChangeEventsSubscriptionException(StorageIRI const& location)
{
    *this << StorageIRIInfo(location);
}

StorageIRI ChangeEventsSubscriptionException::getStorageIRI() const
{
    return detail::requireInfo<StorageIRIInfo>(*this);
}

core::except::IException* ChangeEventsSubscriptionException::clone() const
{
    return new ChangeEventsSubscriptionException(*this);
}

void ChangeEventsSubscriptionException::rethrow() const
{
    throw ChangeEventsSubscriptionException(*this);
}

char const* ChangeEventsSubscriptionException::what() const noexcept
{
    return subscription;
}

std::u16string ChangeEventsSubscriptionException::ToUstringImpl() const
{
    return detail::diagnosticText(subscription, getStorageIRI(), u"\"}");
}

} // namespace foundation::storage::provider
