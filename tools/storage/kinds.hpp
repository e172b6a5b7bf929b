#pragma once

#include <storage/provider/ExistenceType.hpp>
#include <tools/storage/Place.hpp>

namespace foundation::storage::tool {

using Kind = provider::ExistenceTypeExtended;

/// What a place holds; failures name it.
Kind kindOf(Place const& place);

/// The same, where nothing is a failure, and anything but a folder too if the place says that it is one.
Kind existingKindOf(Place const& place);

/// Throws `Failure` for anything but a folder at a place that says that it is one: `a/` is not the file `a`.
void requireKindAsSaid(Place const& place, Kind kind);

/// Whether a place is the root of an archive that is not there. It comes to be with the first thing in it.
bool isRootOfMissingArchive(Place const& place);

/// Throws `Failure` unless the folder is there that holds the place, or is to hold it.
void requireParentFolder(Place const& place);

/// "file", "folder", "link-to-file" and so on: the words of listings and of JSON.
char const* kindName(Kind kind);

/// A file or a folder, be it reached through a link.
bool leadsToFile(Kind kind);
bool leadsToFolder(Kind kind);
bool isLink(Kind kind);

} // namespace foundation::storage::tool
