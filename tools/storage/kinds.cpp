#include <tools/storage/kinds.hpp>

#include <tools/storage/describe.hpp>

namespace foundation::storage::tool {

Kind kindOf(Place const& place)
{
    return at(place, [&] { return place.item().existsExtended(); });
}

Kind existingKindOf(Place const& place)
{
    Kind const kind = kindOf(place);
    if (kind == Kind::None)
        throw Failure{place.text(), describe(provider::ErrorCode::ResourceNotFound)};
    requireKindAsSaid(place, kind);
    return kind;
}

void requireKindAsSaid(Place const& place, Kind kind)
{
    if (place.saysFolder() && kind != Kind::None && !leadsToFolder(kind))
        throw Failure{place.text(), "not a folder, as the slash at the end says"};
}

bool isRootOfMissingArchive(Place const& place)
{
    if (!place.item().getLocation().hasInnerIRI() || kindOf(place) != Kind::None)
        return false;
    return at(place, [&] { return place.item().getCanonicalLocation().getPath() == u"/"; });
}

void requireParentFolder(Place const& place)
{
    if (place.item().hasParent()) {
        Place const parent(place.item().getParent(), place.text());
        if (leadsToFolder(kindOf(parent)) || isRootOfMissingArchive(parent))
            return;
    }
    throw Failure{place.text(), "there is no folder to hold it"};
}

char const* kindName(Kind kind)
{
    switch (kind) {
    case Kind::RegularFile:
        return "file";
    case Kind::SpecialFile:
        return "special";
    case Kind::RegularFolder:
        return "folder";
    case Kind::SymlinkToFile:
        return "link-to-file";
    case Kind::SymlinkToFolder:
        return "link-to-folder";
    case Kind::BrokenSymlink:
        return "broken-link";
    case Kind::None:
        break;
    }
    return "missing";
}

bool leadsToFile(Kind kind)
{
    return kind == Kind::RegularFile || kind == Kind::SymlinkToFile;
}

bool leadsToFolder(Kind kind)
{
    return kind == Kind::RegularFolder || kind == Kind::SymlinkToFolder;
}

bool isLink(Kind kind)
{
    return kind == Kind::SymlinkToFile || kind == Kind::SymlinkToFolder || kind == Kind::BrokenSymlink;
}

} // namespace foundation::storage::tool
