#pragma once

#include <foundation/export.hpp>
#include <storage/provider/ErrorCode.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <string>
#include <vector>

namespace foundation::storage::local {

/// An entry that could not be removed.
struct StayingEntry
{
    std::u16string path; ///< from the folder, as a recursive listing names it; empty for the folder itself
    provider::ErrorCode reason;
};

/// Removes a local folder as `LocalProvider` does with `removeFolderRecursively`, and names each entry that stays.
///
/// Meaning: empty when all is gone. A folder that stays for what it holds is not named. Who would rather go through the
/// rest by the paths of its entries could be led elsewhere by whoever swaps folders for links meanwhile. The setting
/// `root` of a provider is not known here: any local folder will do.
///
/// Errors: `provider::Exception` as from the provider where the folder itself cannot be entered or is none; nothing is
/// removed then.
/// Cost: memory for the path of each entry that stays.
FOUNDATION_API std::vector<StayingEntry> removeFolderAsFarAsPossible(provider::StorageIRI const& folder);

} // namespace foundation::storage::local
