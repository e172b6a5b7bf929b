#pragma once

#include <boost/date_time/posix_time/posix_time_types.hpp>
#include <tools/storage/FolderStack.hpp>
#include <tools/storage/Place.hpp>
#include <tools/storage/attributes.hpp>
#include <tools/storage/kinds.hpp>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace foundation::storage::tool {

/// What the tool tells of a file or folder; what it was not asked for or does not exist is empty.
struct Entry
{
    std::u16string name;
    provider::StorageIRI location;
    Kind kind;
    std::optional<std::uint64_t> size;
    std::optional<boost::posix_time::ptime> modified;
    std::optional<bool> isWritable;
    std::optional<std::uint64_t> depth; ///< how many folders below the argument
    std::optional<std::uint64_t> files; ///< how many files lie below
    std::vector<Attribute> attributes;  ///< those that only some stores have
};

/// One of which nothing is known but what it is.
Entry bareEntry(Place const& place, Kind kind);

/// All of it, asked from the store; failures name the place, be it that nothing is there.
Entry describeEntry(Place const& place);

/// The same, and the extended attributes.
Entry describeFully(Place const& place);

/// What a listing said of a place.
Entry describeEntry(Place const& place, Kind kind, ListedName const& listed);

/// What a place holds that was listed; as the listing has it when it is gone by now.
Kind kindOf(Place const& place, ListedName const& listed);

/// What the listing takes it for: a link is what it leads to.
Kind apparentKind(ListedName const& listed);

/// One JSON object, without the members that are empty.
std::string toJSON(Entry const& entry);

} // namespace foundation::storage::tool
