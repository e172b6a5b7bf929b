#pragma once

#include <tools/storage/Place.hpp>
#include <tools/storage/Session.hpp>

#include <set>
#include <string>

namespace foundation::storage::tool {

/// The last argument of `cp` and `mv`: an existing folder, which receives each source under its name, or what the only
/// source becomes.
class TargetOperand
{
public:
    /// Throws `Failure` when there are several sources, or a slash at the end, and no such folder.
    TargetOperand(Place place, std::size_t sourceCount);

    /// Where a source goes. Throws `Failure` when an earlier source went there, when it is the source itself, and when
    /// one of the two lies inside the other.
    Place targetOf(Place const& source);

private:
    Place nameFor(Place const& source) const;

    Place place_;
    bool isFolder_;
    std::set<std::u16string> taken_;
};

} // namespace foundation::storage::tool
