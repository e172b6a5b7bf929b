#pragma once

#include <array>
#include <bit>
#include <cstddef>

namespace foundation::tests::support {

namespace detail {

/// A pointer to a member function, as the Itanium C++ ABI lays it out.
template <class Member>
std::array<std::ptrdiff_t, 2> wordsOf(Member member)
{
    static_assert(sizeof(member) == 2 * sizeof(std::ptrdiff_t));
    return std::bit_cast<std::array<std::ptrdiff_t, 2>>(member);
}

} // namespace detail

template <class Member>
bool isVirtual(Member member)
{
#ifdef __aarch64__
    return (detail::wordsOf(member)[1] & 1) != 0;
#else
    return (detail::wordsOf(member)[0] & 1) != 0;
#endif
}

/// The place of a virtual function in the table of its class; a destructor takes two places.
template <class Member>
std::size_t slotOf(Member member)
{
#ifdef __aarch64__
    return static_cast<std::size_t>(detail::wordsOf(member)[0]) / sizeof(void*);
#else
    return static_cast<std::size_t>(detail::wordsOf(member)[0] - 1) / sizeof(void*);
#endif
}

} // namespace foundation::tests::support
