#include <storage/local/scratchFiles.hpp>
#include <tools/storage/Session.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/entries.hpp>
#include <tools/storage/format.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/printable.hpp>

#include <algorithm>
#include <fl/filesystem/native_name.hpp>
#include <fmt/format.h>
#include <memory>
#include <utility>

namespace foundation::storage::tool {

namespace {

struct Options
{
    std::vector<std::string> paths{"."};
    std::string sort;
    bool isAll = false;
    bool isLong = false;
    bool isHumanReadable = false;
    bool isJSON = false;
    bool isOnePerLine = true;
    bool endsInNull = false;

    bool needsKind() const { return isLong || isJSON; }
    bool needsAttributes() const { return needsKind() || sort == "size" || sort == "time"; }
};

class Lister
{
public:
    Lister(Options const& options, Session& session) : options_(options), session_(session) {}

    void list(Place const& place);

private:
    void listFolder(Place const& folder);
    void listEntry(Place const& folder, ListedName const& listed);
    void printHeading(Place const& folder);
    Entry entryOf(Place const& folder, ListedName const& listed) const;
    void print(Entry const& entry, std::string const& name);
    void printName(std::string const& name, bool isFolder);
    std::string longForm(Entry const& entry) const;

    Options const& options_;
    Session& session_;
    std::vector<Entry> sorted_;
    bool isFirst_ = true;
};

std::string bytesOf(std::u16string const& name)
{
    return fl::filesystem::to_native_bytes(name);
}

void sortEntries(std::vector<Entry>& entries, std::string const& key)
{
    auto const before = [&key](Entry const& left, Entry const& right) {
        if (key == "size" && left.size != right.size)
            return left.size > right.size;
        if (key == "time" && left.modified != right.modified)
            return left.modified > right.modified;
        return left.name < right.name;
    };
    std::sort(entries.begin(), entries.end(), before);
}

void Lister::list(Place const& place)
{
    if (leadsToFolder(existingKindOf(place))) {
        listFolder(place);
        return;
    }
    print(describeEntry(place), place.text());
    isFirst_ = false;
}

void Lister::listFolder(Place const& folder)
{
    auto const listing = at(folder, [&] {
        return options_.needsAttributes() ? folder.item().listAll() : folder.item().listAllNamesOnly();
    });
    printHeading(folder);
    session_.attempt([&] {
        for (; listing->hasEntry(); at(folder, [&] { listing->next(); })) {
            checkInterrupt();
            session_.attempt([&] { listEntry(folder, listedNameOf(listing->entry())); });
        }
    });
    sortEntries(sorted_, options_.sort);
    for (Entry const& entry : std::exchange(sorted_, {}))
        print(entry, bytesOf(entry.name));
}

void Lister::listEntry(Place const& folder, ListedName const& listed)
{
    if (!options_.isAll && local::isScratchName(listed.name))
        return;
    if (!options_.sort.empty())
        sorted_.push_back(entryOf(folder, listed));
    else if (options_.needsAttributes())
        print(entryOf(folder, listed), bytesOf(listed.name));
    else
        printName(bytesOf(listed.name), !listed.isFile);
}

void Lister::printHeading(Place const& folder)
{
    if (options_.paths.size() == 1 || options_.isJSON || options_.endsInNull)
        return;
    session_.output().write(isFirst_ ? "" : "\n");
    session_.printName(folder.text() + ':');
    isFirst_ = false;
}

Entry Lister::entryOf(Place const& folder, ListedName const& listed) const
{
    Place const place = folder.child(listed.name);
    return describeEntry(place, options_.needsKind() ? kindOf(place, listed) : apparentKind(listed), listed);
}

void Lister::print(Entry const& entry, std::string const& name)
{
    Output& output = session_.output();
    if (options_.isJSON) {
        output.write(toJSON(entry));
        output.endLine();
        return;
    }
    if (options_.isLong)
        output.write(longForm(entry));
    printName(name, leadsToFolder(entry.kind));
}

void Lister::printName(std::string const& name, bool isFolder)
{
    bool const isMarked = isFolder && session_.output().isTerminal() && !options_.endsInNull;
    session_.printName(isMarked ? name + '/' : name, options_.endsInNull ? '\0' : '\n');
}

std::string Lister::longForm(Entry const& entry) const
{
    std::string size = "-";
    if (entry.size)
        size = options_.isHumanReadable ? formatSize(*entry.size) : fmt::to_string(*entry.size);
    std::string const modified = entry.modified ? formatTime(*entry.modified, Precision::Seconds) : "-";
    return fmt::format("{:<14}  {:>12}  {:<20}  ", kindName(entry.kind), size, modified);
}

} // namespace

Action defineLs(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addFlag(app, "-l,--long", options->isLong, "Also print type, size in bytes and time of the last change (UTC)");
    addHumanReadable(app, options->isHumanReadable, "With -l, print sizes as 1.5 KiB, 23 MiB");
    addFlag(app, "-a,--all", options->isAll, "Also list scratch files, of writes that are not finished");
    addFlag(app, "-1", options->isOnePerLine, "One name a line; this is always so");
    addFlag(app, "--json", options->isJSON, "Print one JSON object a line for each entry");
    addFlag(app, "-0,--null", options->endsInNull, "End each name by a NUL, not by a line end; no headings");
    addChoice(app, "--sort", "Sort, which takes memory; otherwise the order is the store's", {"name", "size", "time"},
              options->sort);
    addOperands(app, "[PATH...]", "Folders to list, and files; the working folder when there are none", 0,
                options->paths);
    return [options](Session& session) {
        Lister lister(*options, session);
        session.forEachPlace(options->paths, [&](Place const& place) { lister.list(place); });
    };
}

} // namespace foundation::storage::tool
