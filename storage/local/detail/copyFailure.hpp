#pragma once

#include <storage/local/detail/copyContent.hpp>
#include <storage/provider/StorageIRI.hpp>

namespace foundation::storage::local::detail {

/// Throws the `Exception` for a copy that failed, at the end that failed; does nothing for one that did not.
void requireCopied(CopyResult const& result, provider::StorageIRI const& from, provider::StorageIRI const& to);

} // namespace foundation::storage::local::detail
