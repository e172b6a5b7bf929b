#pragma once

#include <foundation/core/except/AnonymousInternalException.hpp>

#include <exception>
#include <string>
#include <typeinfo>

namespace foundation::tests::support {

/// What `action` throws says, when it throws an `Expected` and nothing derived from it; otherwise what happened
/// instead.
template <class Expected, class Action>
std::string textOf(Action action)
{
    try {
        action();
    } catch (Expected const& exception) {
        if (typeid(exception) == typeid(Expected))
            return exception.what();
        return std::string("thrown as ") + typeid(exception).name();
    } catch (std::exception const& exception) {
        return std::string("thrown as ") + typeid(exception).name() + ": " + exception.what();
    }
    return "nothing thrown";
}

/// What `action` throws says, when it throws an `Expected` or something derived from it.
template <class Expected, class Action>
std::string textOfAny(Action action)
{
    try {
        action();
    } catch (Expected const& exception) {
        return exception.what();
    }
    return "nothing thrown";
}

/// What `textOf` answers, for the message-only exceptions of the system; both of their texts have to say it.
template <class StdBase, class Action>
std::u16string internalTextOf(Action action)
{
    using Expected = core::except::detail::AnonymousInternalException<StdBase>;
    std::u16string text;
    std::string const inUtf8 = textOf<Expected>([&] {
        try {
            action();
        } catch (Expected const& exception) {
            text = exception.ToUstringImpl();
            throw;
        }
    });
    if (text.empty() || core::except::detail::AnonymousInternalException<StdBase>(inUtf8).ToUstringImpl() != text)
        return u"different texts: " + std::u16string(inUtf8.begin(), inUtf8.end()) + u", " + text;
    return text;
}

} // namespace foundation::tests::support
