#pragma once

#include <concepts>
#include <exception>
#include <string>
#include <type_traits>

#include <foundation/core/except/IException.hpp>
#include <foundation/core/except/IInternalException.hpp>
#include <foundation/export.hpp>

namespace foundation::core::except {

/// Joins an interface of the exception family with a standard exception.
///
/// `Interface` is `IException` or derives from it, `StdBase` is a standard exception, and `Tag` sets families apart
/// that share both (`void` where there is no need). `clone` and `rethrow` are left to the concrete class: `return new
/// Concrete(*this);` and `throw Concrete(*this);`. Such exceptions are thrown with `throw`; `boost::throw_exception`
/// cannot wrap a class that has a `clone` of its own.
template <class Interface, class StdBase, class Tag>
class FOUNDATION_API Exception : public Interface, public StdBase
{
    static_assert(std::derived_from<Interface, IException>);
    static_assert(std::derived_from<StdBase, std::exception>);

public:
    Exception() requires std::is_default_constructible_v<StdBase>
    = default;

    /// Hands the message to a standard exception that takes one.
    explicit Exception(std::string const& message) requires std::constructible_from<StdBase, std::string const&>
        : StdBase(message)
    {}

    /// What the interface says, under both bases.
    [[nodiscard]] char const* what() const noexcept override { return Interface::what(); }

    /// What the standard base itself says, as UTF-16 through `convert_str`. An override of `what` is not asked.
    [[nodiscard]] std::u16string ToUstringImpl() const override
    {
        return this->convert_str(std::string(StdBase::what()));
    }
};

} // namespace foundation::core::except
