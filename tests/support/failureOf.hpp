#pragma once

#include <storage/provider/Exception.hpp>

#include <sstream>
#include <string>

namespace foundation::tests::support {

/// A failure as text, to be compared with what `failureOf` answers.
inline std::string failure(storage::provider::ErrorCode code, storage::provider::StorageIRI const& iri)
{
    std::ostringstream text;
    text << code << " at " << iri;
    return text.str();
}

/// The failure that an action ends with, as text; "no failure" without one. Other exceptions pass.
template <typename Action>
std::string failureOf(Action const& action)
{
    try {
        action();
        return "no failure";
    } catch (storage::provider::Exception const& error) {
        return failure(error.getErrorCode(), error.getStorageIRI());
    }
}

} // namespace foundation::tests::support
