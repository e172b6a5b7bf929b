#include <tools/storage/eventLines.hpp>

#include <fl/i18n/utf8.hpp>
#include <fmt/format.h>
#include <nlohmann/json.hpp>

namespace foundation::storage::tool {

namespace {

std::string iriOf(Place const& place)
{
    return fl::i18n::to_utf8(place.item().getLocation().toString(), fl::i18n::Malformed::Replace);
}

char const* wordOf(events::EntryType type)
{
    switch (type) {
    case events::EntryType::File:
        return "file";
    case events::EntryType::Folder:
        return "folder";
    default:
        return "unknown";
    }
}

} // namespace

char const* wordOf(events::Kind kind)
{
    switch (kind) {
    case events::Kind::Created:
        return "created";
    case events::Kind::Removed:
        return "removed";
    case events::Kind::Modified:
        return "modified";
    case events::Kind::AttributesChanged:
        return "attributes";
    case events::Kind::Moved:
        break;
    }
    return "moved";
}

std::vector<std::string> eventWords()
{
    return {"created", "removed", "modified", "attributes", "moved"};
}

std::string toText(EventLine const& line)
{
    std::string text =
        fmt::format("{}{}{:<10}  {}", line.time, line.time.empty() ? "" : "  ", wordOf(line.kind), line.place.text());
    if (line.target)
        text.append(" -> ").append(line.target->text());
    return text;
}

std::string toJSON(EventLine const& line)
{
    nlohmann::ordered_json object;
    object["kind"] = wordOf(line.kind);
    object["location"] = iriOf(line.place);
    if (line.target)
        object["to"] = iriOf(*line.target);
    object["type"] = wordOf(line.type);
    if (!line.time.empty())
        object["time"] = line.time;
    constexpr int onOneLine = -1;
    constexpr bool inASCII = true;
    return object.dump(onOneLine, ' ', inASCII);
}

} // namespace foundation::storage::tool
