#pragma once

#include <storage/provider/ErrorCode.hpp>
#include <tools/storage/Failure.hpp>
#include <tools/storage/Place.hpp>

#include <utility>

namespace foundation::storage::tool {

/// What happened, in plain words.
char const* describe(provider::ErrorCode code);

/// Throws the exception that is being handled as a `Failure` at `place`. To be called from a handler only.
[[noreturn]] void rethrowAsFailure(Place const& place);

/// Calls `action`, which works on `place`; turns its exceptions into a `Failure` there.
template <typename Action>
decltype(auto) at(Place const& place, Action&& action)
{
    try {
        return std::forward<Action>(action)();
    } catch (std::exception const&) {
        rethrowAsFailure(place);
    }
}

} // namespace foundation::storage::tool
