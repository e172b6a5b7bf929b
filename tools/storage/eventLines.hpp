#pragma once

#include <foundation/storage/events/EntryType.hpp>
#include <foundation/storage/events/Kind.hpp>
#include <tools/storage/Place.hpp>

#include <optional>
#include <string>
#include <vector>

namespace foundation::storage::tool {

/// An event as it is told to the user.
struct EventLine
{
    events::Kind kind;
    Place place;
    std::optional<Place> target; ///< where it was moved to
    events::EntryType type;
    std::string time; ///< empty when it is not to be told
};

/// "created", "removed" and so on: the words of the output and of options.
char const* wordOf(events::Kind kind);

/// The words of all kinds.
std::vector<std::string> eventWords();

/// As a line of text, which `printable` has not gone over.
std::string toText(EventLine const& line);

/// As a JSON object in ASCII.
std::string toJSON(EventLine const& line);

} // namespace foundation::storage::tool
