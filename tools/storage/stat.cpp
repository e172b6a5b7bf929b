#include <tools/storage/Session.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/entries.hpp>
#include <tools/storage/format.hpp>
#include <tools/storage/printable.hpp>

#include <fl/i18n/utf8.hpp>
#include <fmt/format.h>
#include <memory>

namespace foundation::storage::tool {

namespace {

struct Options
{
    std::vector<std::string> paths;
    bool isJSON = false;
};

void printField(Session& session, std::string_view name, std::string_view value)
{
    session.output().write(fmt::format("  {:<10} ", name));
    session.printName(value);
}

/// Escaped for a terminal or not: a value may hold line ends.
void printAttribute(Session& session, Attribute const& attribute)
{
    session.output().write(fmt::format("  {:<10} {}", printable(attribute.name), toText(attribute)));
    session.output().endLine();
}

void print(Session& session, Place const& place, Entry const& entry)
{
    session.printName(place.text());
    printField(session, "location", fl::i18n::to_utf8(entry.location.toString(), fl::i18n::Malformed::Replace));
    printField(session, "type", kindName(entry.kind));
    if (entry.size)
        printField(session, "size", fmt::to_string(*entry.size));
    if (entry.modified)
        printField(session, "modified", formatTime(*entry.modified, Precision::Microseconds));
    if (entry.isWritable)
        printField(session, "writable", *entry.isWritable ? "yes" : "no");
    for (Attribute const& attribute : entry.attributes)
        printAttribute(session, attribute);
}

void describe(Session& session, Options const& options, Place const& place)
{
    Entry const entry = describeFully(place);
    if (!options.isJSON) {
        print(session, place, entry);
        return;
    }
    session.output().write(toJSON(entry));
    session.output().endLine();
}

} // namespace

Action defineStat(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addFlag(app, "--json", options->isJSON, "Print one JSON object a line for each path");
    addOperands(app, "PATH...", "Files and folders", 1, options->paths);
    return [options](Session& session) {
        session.forEachPlace(options->paths, [&](Place const& place) { describe(session, *options, place); });
    };
}

} // namespace foundation::storage::tool
