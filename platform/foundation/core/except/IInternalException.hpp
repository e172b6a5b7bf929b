#pragma once

#include <foundation/core/except/IException.hpp>
#include <foundation/export.hpp>

namespace foundation::core::except {

/// Marks exceptions that report a failure inside the system, as opposed to those made for the user's eyes.
class FOUNDATION_API IInternalException : public IException
{
public:
    ~IInternalException() noexcept override;

protected:
    IInternalException() = default;
    IInternalException(IInternalException const&) = default;
    IInternalException& operator=(IInternalException const&) = default;
};

} // namespace foundation::core::except
