#include <tools/storage/TargetOperand.hpp>

#include <tools/storage/kinds.hpp>
#include <tools/storage/physicalPath.hpp>

#include <utility>

namespace foundation::storage::tool {

TargetOperand::TargetOperand(Place place, std::size_t sourceCount)
    : place_(std::move(place)), isFolder_(leadsToFolder(kindOf(place_)) || isRootOfMissingArchive(place_))
{
    if (isFolder_)
        return;
    if (sourceCount > 1)
        throw Failure{place_.text(), "not a folder, which it must be for several sources"};
    requireParentFolder(place_);
}

Place TargetOperand::nameFor(Place const& source) const
{
    std::u16string const name = source.item().getName();
    bool const standsForItself = name == u"." || name == u".." || name == u"/";
    return isFolder_ && !standsForItself ? place_.child(name) : place_;
}

Place TargetOperand::targetOf(Place const& source)
{
    Place target = nameFor(source);
    bool const isFolder = kindOf(source) == Kind::RegularFolder;
    if (!isFolder_ && !isFolder && place_.saysFolder())
        throw Failure{place_.text(), "no such folder"};
    if (isSame(source, target))
        throw Failure{source.text(), "source and target are the same"};
    if (isFolder && liesInside(target, source))
        throw Failure{source.text(), "the target lies inside the source: " + target.text()};
    if (isFolder && liesInside(source, target))
        throw Failure{source.text(),
                      "the source lies inside the folder that it would be merged into: " + target.text()};
    if (!taken_.insert(physicalPath(target)).second)
        throw Failure{source.text(), "another source went to the same target before: " + target.text()};
    return target;
}

} // namespace foundation::storage::tool
