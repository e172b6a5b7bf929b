#pragma once

#include <cstdint>
#include <functional>
#include <stdexcept>
#include <string>

namespace foundation::tests::support {

/// Content that says which it is, and shows when it is torn or mixed: a number, a length, and as many bytes that only
/// this number has, with their sum.
inline std::string madeContent(std::uint64_t number)
{
    std::size_t const length = 4096 + number * 7919 % 12289;
    std::string body(length, '\0');
    std::uint64_t state = number * 0x9E3779B97F4A7C15u + 1;
    for (char& byte : body) {
        state = state * 6364136223846793005u + 1442695040888963407u;
        byte = static_cast<char>(state >> 56);
    }
    std::string const sum = std::to_string(std::hash<std::string>()(body));
    return std::to_string(number) + " " + std::to_string(length) + " " + sum + "\n" + body;
}

/// Which content this is; throws `std::runtime_error` for one that is not whole.
inline std::uint64_t numberOfContent(std::string const& content)
{
    std::uint64_t number = 0;
    try {
        number = std::stoull(content);
    } catch (std::logic_error const&) {
        throw std::runtime_error("content without a number, of " + std::to_string(content.size()) + " bytes");
    }
    if (content != madeContent(number))
        throw std::runtime_error("content " + std::to_string(number) + " is torn");
    return number;
}

} // namespace foundation::tests::support
