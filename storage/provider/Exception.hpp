#pragma once

#include <foundation/core/except/Exception.hpp>
#include <foundation/core/except/IInternalException.hpp>
#include <foundation/export.hpp>
#include <storage/provider/ErrorCode.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <boost/exception/info.hpp>

#include <exception>
#include <string>

namespace foundation::storage::provider {

struct FOUNDATION_API TagErrorCode
{};

struct FOUNDATION_API TagStorageIRI
{};

/// The entries under which exceptions carry their code and their location; handlers may read and add entries with
/// `boost::get_error_info` and `<<`. Copies of an exception share them.
using ErrorCodeInfo = boost::error_info<TagErrorCode, ErrorCode>;
using StorageIRIInfo = boost::error_info<TagStorageIRI, StorageIRI>;

/// A failure at a location of a store.
///
/// `what` is the class name alone; `ToUstringImpl` names location and code.
class FOUNDATION_API Exception : public core::except::Exception<core::except::IInternalException, std::exception, void>
{
public:
    Exception(ErrorCode const& code, StorageIRI const& location);

    /// Both throw `std::logic_error` when a handler has taken the entry away.
    ErrorCode getErrorCode() const;
    StorageIRI getStorageIRI() const;

    core::except::IException* clone() const override;
    [[noreturn]] void rethrow() const override;
    char const* what() const noexcept override;
    std::u16string ToUstringImpl() const override;
};

} // namespace foundation::storage::provider
