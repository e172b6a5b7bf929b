#pragma once

#include <foundation/export.hpp>
#include <storage/local/detail/Root.hpp>

#include <boost/property_tree/ptree_fwd.hpp>

namespace foundation::storage::local::detail {

/// What has to be on the disk before a commit or an atomic copy returns.
enum class Durability
{
    None, ///< nothing
    File, ///< the content, before it takes the place of the old one
    Full, ///< the content, and then the names: the folder it was renamed in, and folders newly made
};

/// What copies of files keep of their sources, beside the content.
struct Preserved
{
    bool times = false;              ///< that of the last change
    bool extendedAttributes = false; ///< those of the user
};

struct FOUNDATION_API Settings
{
    Settings() = default;

    /// Takes the keys `durability` ("none", "file" or "full"), `preserve` (any of "times" and "xattrs", separated by
    /// commas) and `root` (an absolute path). Throws `std::invalid_argument` naming the key for any other key or value,
    /// for a key that stands there twice, and for what `Root` refuses.
    explicit Settings(boost::property_tree::ptree const& tree);

    Durability durability = Durability::Full;
    Preserved preserved;
    Root root;
};

} // namespace foundation::storage::local::detail
