#pragma once

#include <tools/storage/Failure.hpp>
#include <tools/storage/Place.hpp>

#include <cstdint>
#include <optional>
#include <string>

namespace foundation::storage::tool {

/// What became of something that was to be copied or moved; what is not known or does not exist is empty.
struct Transfer
{
    std::string source; ///< its location
    std::string target;
    char const* result; ///< "copied", "skipped", "moved" or "failed"
    std::optional<std::uint64_t> bytes;
    std::string error;
};

Transfer transferOf(Place const& source, Place const& target, char const* result,
                    std::optional<std::uint64_t> bytes = std::nullopt);
Transfer failedTransfer(Place const& source, Place const& target, Failure const& failure);

/// Of what goes nobody knows where.
Transfer failedTransfer(Place const& source, Failure const& failure);

/// Of an argument that names nothing: the failure says which.
Transfer failedTransfer(Failure const& failure);

/// One JSON object, without the members that are empty.
std::string toJSON(Transfer const& transfer);

} // namespace foundation::storage::tool
