#pragma once

#include <storage/provider/StorageItem.hpp>
#include <tools/storage/Place.hpp>

#include <string>

namespace foundation::storage::tool {

/// Whether the place is one in the file system of this machine.
bool isLocal(Place const& place);

/// One text for what a place names, whether it exists or not and by whichever links and dots it is reached.
std::u16string physicalPath(Place const& place);

/// Whether both name one thing.
bool isSame(Place const& left, Place const& right);

/// Whether `inner` lies somewhere below `outer`.
bool liesInside(Place const& inner, Place const& outer);

} // namespace foundation::storage::tool
