#pragma once

#include <sstream>
#include <string>

namespace foundation::tests::support {

/// What inserting a value into a fresh stream writes.
template <class Value>
std::string printed(Value const& value)
{
    std::ostringstream stream;
    stream << value;
    return stream.str();
}

/// For `static_assert(isDeclared<static_cast<Type>(&function)>)`: a function of exactly that type can be named.
template <auto Function>
inline constexpr bool isDeclared = true;

/// Whether inserting a value answers the very stream that it was given.
template <class Value>
bool answersItsStream(Value const& value)
{
    std::ostringstream stream;
    return &(stream << value) == &stream;
}

/// What a field of `width` filled with dots shows of a value; text is written as one string, which fills it once.
template <class Value>
std::string printedInField(Value const& value, int width)
{
    std::ostringstream stream;
    stream.width(width);
    stream.fill('.');
    stream << value;
    return stream.str();
}

} // namespace foundation::tests::support
