#pragma once

#include <fl/i18n/utf8.hpp>
#include <foundation/core/except/IException.hpp>

#include <boost/exception/diagnostic_information.hpp>

#include <exception>
#include <stdexcept>
#include <string>

namespace foundation::storage::registry {

/// All that the exception in flight says in any way, and those nested in it.
inline std::string wordsOfCurrentException()
{
    std::string words = boost::current_exception_diagnostic_information(true);
    try {
        throw;
    } catch (core::except::IException const& error) {
        words += '\n' + fl::i18n::to_utf8(error.ToUstringImpl(), fl::i18n::Malformed::Replace);
    } catch (std::exception const& error) {
        words += std::string("\n") + error.what();
    } catch (...) {
        words += "\nno exception of a known kind";
    }
    return words;
}

/// All that the failure of an action says; throws `std::logic_error` when it does not fail.
template <typename Action>
std::string wordsOf(Action const& action)
{
    try {
        action();
    } catch (std::exception const& error) {
        std::string words = wordsOfCurrentException();
        try {
            std::rethrow_if_nested(error);
        } catch (...) {
            words += wordsOfCurrentException();
        }
        return words;
    } catch (...) {
        return wordsOfCurrentException();
    }
    throw std::logic_error("nothing failed");
}

} // namespace foundation::storage::registry
