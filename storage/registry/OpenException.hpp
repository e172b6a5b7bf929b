#pragma once

#include <foundation/export.hpp>
#include <storage/provider/Exception.hpp>

#include <iosfwd>
#include <string>

namespace foundation::storage::registry {

/// A location that a registry does not open, whatever may be there; `InvalidLocation` for whoever asks for the code.
///
/// The location is that part of what was to be opened which is at fault: of nested containers one of them, or the
/// store that holds them all. A password in it is replaced by "***". For a text that is no location at all it is the
/// root of the scheme. `what` is the class name alone; `ToUstringImpl` says what is wrong, in words.
class FOUNDATION_API OpenException : public provider::Exception
{
public:
    enum class Reason
    {
        UnknownScheme,           ///< no factory was added for the scheme
        ContainerNeedsContainer, ///< the scheme is one of containers, and no container's location follows it
        PlainSchemeOfContainer,  ///< a container's location follows a scheme that is none of containers
        CredentialsInLocation,   ///< a password, which belongs to the configuration
    };

    OpenException(Reason reason, provider::StorageIRI const& location);

    Reason getReason() const { return reason_; }

    core::except::IException* clone() const override;
    [[noreturn]] void rethrow() const override;
    char const* what() const noexcept override;
    std::u16string ToUstringImpl() const override;

private:
    Reason reason_;
};

/// Writes "Reason::" and the enumerator, or "Unhandled Reason" for any other value.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, OpenException::Reason const& reason);

} // namespace foundation::storage::registry
