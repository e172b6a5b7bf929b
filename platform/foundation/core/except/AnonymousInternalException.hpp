#pragma once

#include <stdexcept>
#include <string>

#include <foundation/core/except/Exception.hpp>
#include <foundation/core/except/IInternalException.hpp>
#include <foundation/export.hpp>

namespace foundation::core::except::detail {

/// An internal exception that has a message and no type of its own: handlers know it by its standard base.
///
/// `what()` is the message in UTF-8, `ToUstringImpl()` the message in UTF-16.
template <class StdBase>
class FOUNDATION_API AnonymousInternalException : public Exception<IInternalException, StdBase, void>
{
public:
    explicit AnonymousInternalException(std::string const& message);

    [[nodiscard]] IException* clone() const override;
    [[noreturn]] void rethrow() const override;
};

template <class StdBase>
AnonymousInternalException<StdBase>::AnonymousInternalException(std::string const& message)
    : Exception<IInternalException, StdBase, void>(message)
{}

template <class StdBase>
IException* AnonymousInternalException<StdBase>::clone() const
{
    return new AnonymousInternalException(*this);
}

template <class StdBase>
void AnonymousInternalException<StdBase>::rethrow() const
{
    throw AnonymousInternalException(*this);
}

extern template class AnonymousInternalException<std::logic_error>;
extern template class AnonymousInternalException<std::runtime_error>;

} // namespace foundation::core::except::detail
