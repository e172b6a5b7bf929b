#pragma once

#include <string>

namespace foundation::storage::tool {

/// Something that could not be done at a location; both in the words that the user is to read.
///
/// Not a `std::exception`, so that what turns those into failures leaves failures alone.
struct Failure
{
    std::string location;
    std::string reason;
};

} // namespace foundation::storage::tool
