#pragma once

#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>

#include <string>

namespace foundation::storage::tool {

/// What happened, in plain words: those that the failure carries, if any, else those for its code.
std::string explain(provider::Exception const& error);
std::string explain(provider::ByteStreamFailure const& error);

} // namespace foundation::storage::tool
