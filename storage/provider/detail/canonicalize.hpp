#pragma once

#include <fl/filesystem/upath.hpp>
#include <foundation/export.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <functional>
#include <string>

namespace foundation::storage::provider::detail {

/// Finds the one path of something that exists; fails as `fl::filesystem::get_pathname_from_volume` does.
using Canonicalize = std::function<fl::filesystem::upath(fl::filesystem::upath const&)>;

/// `toCanonicalizedStorageIRI` over any file system.
FOUNDATION_API StorageIRI toCanonicalizedStorageIRI(std::u16string const& scheme, fl::filesystem::upath const& path,
                                                    Canonicalize const& canonicalize);

} // namespace foundation::storage::provider::detail
