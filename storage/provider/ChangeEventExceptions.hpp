#pragma once

#include <foundation/core/except/Exception.hpp>
#include <foundation/core/except/IInternalException.hpp>
#include <foundation/export.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <exception>
#include <string>

namespace foundation::storage::provider {

/// The store does not report changes of this location.
///
/// `what` is the class name alone; `ToUstringImpl` names the location.
class FOUNDATION_API ChangeEventsNotSupportedException
    : public core::except::Exception<core::except::IInternalException, std::exception, void>
{
public:
    explicit ChangeEventsNotSupportedException(StorageIRI const& location);

    /// Throws `std::logic_error` when a handler has taken the entry away.
    StorageIRI getStorageIRI() const;

    core::except::IException* clone() const override;
    [[noreturn]] void rethrow() const override;
    char const* what() const noexcept override;
    std::u16string ToUstringImpl() const override;
};

/// A subscription to the changes of this location could not be set up.
///
/// `what` is the class name alone; `ToUstringImpl` names the location.
class FOUNDATION_API ChangeEventsSubscriptionException
    : public core::except::Exception<core::except::IInternalException, std::exception, void>
{
public:
    explicit ChangeEventsSubscriptionException(StorageIRI const& location);

    /// Throws `std::logic_error` when a handler has taken the entry away.
    StorageIRI getStorageIRI() const;

    core::except::IException* clone() const override;
    [[noreturn]] void rethrow() const override;
    char const* what() const noexcept override;
    std::u16string ToUstringImpl() const override;
};

} // namespace foundation::storage::provider
