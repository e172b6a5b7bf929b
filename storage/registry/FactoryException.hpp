#pragma once

#include <foundation/export.hpp>
#include <storage/provider/Exception.hpp>

#include <string>

namespace foundation::storage::registry {

/// The failure of a factory or provider that has settings, without what it said, which could repeat them.
///
/// The code is that of the failure, `Unknown` where it had none. The location is the one to be opened, or the root of
/// the scheme. `what` is the class name alone; `ToUstringImpl` names location and code.
class FOUNDATION_API FactoryException : public provider::Exception
{
public:
    using provider::Exception::Exception;

    core::except::IException* clone() const override;
    [[noreturn]] void rethrow() const override;
    char const* what() const noexcept override;
    std::u16string ToUstringImpl() const override;
};

} // namespace foundation::storage::registry
