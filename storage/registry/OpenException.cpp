#include <storage/registry/OpenException.hpp>

#include <ostream>

namespace foundation::storage::registry {

using provider::StorageIRI;
using Reason = OpenException::Reason;

namespace {

char const* nameOf(Reason reason)
{
    switch (reason) {
    case Reason::UnknownScheme:
        return "Reason::UnknownScheme";
    case Reason::ContainerNeedsContainer:
        return "Reason::ContainerNeedsContainer";
    case Reason::PlainSchemeOfContainer:
        return "Reason::PlainSchemeOfContainer";
    case Reason::CredentialsInLocation:
        return "Reason::CredentialsInLocation";
    }
    return "Unhandled Reason";
}

std::u16string quoted(std::u16string const& text)
{
    return u'"' + text + u'"';
}

} // namespace

OpenException::OpenException(Reason reason, StorageIRI const& location)
    : Exception(provider::ErrorCode::InvalidLocation, location), reason_(reason)
{}

core::except::IException* OpenException::clone() const
{
    return new OpenException(*this);
}

void OpenException::rethrow() const
{
    throw OpenException(*this);
}

char const* OpenException::what() const noexcept
{
    return "foundation::storage::registry::OpenException";
}

std::u16string OpenException::ToUstringImpl() const
{
    StorageIRI const location = getStorageIRI();
    std::u16string const scheme = location.getScheme();
    std::u16string const place = u"Cannot open " + quoted(location.toString()) + u": ";
    switch (reason_) {
    case Reason::UnknownScheme:
        return place + u"no store serves the scheme " + quoted(scheme) + u".";
    case Reason::ContainerNeedsContainer:
        return place + u"the scheme " + quoted(scheme) +
               u" names places inside a container, whose own location must follow, as in " +
               quoted(scheme + u":file:///container!/place") + u".";
    case Reason::PlainSchemeOfContainer:
        return place + u"the scheme " + quoted(scheme) + u" names no places inside a container; '/' must follow \"" +
               scheme + u":\".";
    case Reason::CredentialsInLocation:
        break;
    }
    return place + u"a location must not carry a password, which belongs to the configuration.";
}

std::ostream& operator<<(std::ostream& stream, Reason const& reason)
{
    return stream << nameOf(reason);
}

} // namespace foundation::storage::registry
