#include <storage/local/scratchFiles.hpp>
#include <tools/storage/Session.hpp>
#include <tools/storage/TreeWalk.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/entries.hpp>
#include <tools/storage/values.hpp>

#include <algorithm>
#include <boost/date_time/microsec_time_clock.hpp>
#include <fl/filesystem/native_name.hpp>
#include <fl/filesystem/wildcards.hpp>
#include <memory>
#include <stdexcept>

namespace foundation::storage::tool {

namespace {

using boost::posix_time::ptime;
using fl::filesystem::LetterCase;
using fl::filesystem::Wildcards;

struct Options
{
    std::vector<std::string> paths{"."};
    std::vector<Wildcards> names;
    std::vector<std::string> types;
    std::vector<SizeTest> sizes;
    std::optional<ptime> newer;
    std::optional<ptime> older;
    std::optional<std::size_t> maximumDepth;
    bool isAll = false;
    bool isJSON = false;
    bool endsInNull = false;

    bool needsAttributes() const { return !sizes.empty() || newer || older || isJSON; }
    bool needsKind() const { return !types.empty() || needsAttributes(); }
    Listing listing() const { return needsAttributes() ? Listing::WithAttributes : Listing::NamesOnly; }
};

bool isOfType(Kind kind, std::string const& type)
{
    return type == "link" ? isLink(kind) : type == kindName(kind);
}

bool fitsName(Options const& options, std::u16string const& name)
{
    auto const matches = [&](Wildcards const& pattern) { return pattern.matches(name); };
    return options.names.empty() || std::any_of(options.names.begin(), options.names.end(), matches);
}

bool fitsType(Options const& options, Kind kind)
{
    auto const isIt = [&](std::string const& type) { return isOfType(kind, type); };
    return options.types.empty() || std::any_of(options.types.begin(), options.types.end(), isIt);
}

bool fitsSize(Options const& options, Kind kind, std::optional<std::uint64_t> size)
{
    auto const holds = [&](SizeTest const& test) { return kind == Kind::RegularFile && size && test.holds(*size); };
    return std::all_of(options.sizes.begin(), options.sizes.end(), holds);
}

bool fitsTime(Options const& options, std::optional<ptime> const& time)
{
    if (!options.newer && !options.older)
        return true;
    return time && !time->is_special() && (!options.newer || *time > *options.newer) &&
           (!options.older || *time < *options.older);
}

class Finder : public TreeVisitor
{
public:
    Finder(Session& session, Options const& options) : session_(session), options_(options) {}

    void find(Place const& root)
    {
        Entry entry = options_.needsAttributes() ? describeEntry(root) : bareEntry(root, existingKindOf(root));
        entry.isWritable.reset(); // not known of what is listed
        bool const fits = fitsName(options_, entry.name) && fitsType(options_, entry.kind) &&
                          fitsSize(options_, entry.kind, entry.size) && fitsTime(options_, entry.modified);
        if (fits && options_.isJSON)
            session_.printJSON(toJSON(entry));
        else if (fits)
            printName(root.text());
        if (leadsToFolder(entry.kind) && options_.maximumDepth != 0U)
            walkTree(session_, root, options_.listing(), *this);
    }

    bool visit(TreeCursor& tree, ListedName const& listed) override
    {
        if (!options_.isAll && local::isScratchName(listed.name))
            return false;
        bool const isCandidate = fitsName(options_, listed.name);
        bool const needsKind = !listed.isFile || (isCandidate && options_.needsKind());
        Kind const kind = needsKind ? tree.kindOf(listed) : apparentKind(listed);
        if (isCandidate && fits(listed, kind))
            print(tree, listed, kind);
        return kind == Kind::RegularFolder && (!options_.maximumDepth || tree.depth() + 1 < *options_.maximumDepth);
    }

private:
    bool fits(ListedName const& listed, Kind kind) const
    {
        bool const isBroken = kind == Kind::BrokenSymlink;
        return fitsType(options_, kind) && fitsSize(options_, kind, isBroken ? std::nullopt : listed.size) &&
               fitsTime(options_, isBroken ? std::nullopt : listed.modified);
    }

    /// The location of an entry takes long to make.
    void print(TreeCursor const& tree, ListedName const& listed, Kind kind)
    {
        if (options_.isJSON)
            session_.printJSON(toJSON(describeEntry(tree.placeOf(listed), kind, listed)));
        else
            printName(tree.textOf(listed));
    }

    void printName(std::string const& text) { session_.printName(text, options_.endsInNull ? '\0' : '\n'); }

    Session& session_;
    Options const& options_;
};

Wildcards makePattern(std::string const& text, LetterCase letterCase)
{
    if (text.find('/') != std::string::npos)
        throw std::invalid_argument('\'' + text + "' has a '/', which no name has");
    return Wildcards(fl::filesystem::from_native_bytes(text), letterCase);
}

void addPatterns(CLI::App& app, Options& options)
{
    addValues(app, "-n,--name", "PATTERN", "Only what has such a name; * ? and [a-z] are those of the shell",
              [&](std::string const& text) { options.names.push_back(makePattern(text, LetterCase::Matters)); });
    addValues(app, "-i,--iname", "PATTERN", "The same, in upper or lower case",
              [&](std::string const& text) { options.names.push_back(makePattern(text, LetterCase::Ignored)); });
}

void addTimes(CLI::App& app, Options& options)
{
    ptime const now = boost::posix_time::microsec_clock::universal_time();
    addValues(app, "--newer", "TIME", "Only what was changed after 2024-02-29, 2024-02-29T12:34:56Z (UTC) or 36h ago",
              [&options, now](std::string const& text) { options.newer = parseTime(text, now); });
    addValues(app, "--older", "TIME", "Only what was changed before that time; 10min, 36h, 7d, 2w mean so long ago",
              [&options, now](std::string const& text) { options.older = parseTime(text, now); });
}

/// A path that begins with a dash would not be taken for one where it is printed.
std::string usableAsArgument(std::string const& path)
{
    return path.starts_with('-') ? "./" + path : path;
}

} // namespace

Action defineFind(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addPatterns(app, *options);
    addChoices(app, "-t,--type", "Only what is of this type, or of one of several that are given",
               {"file", "folder", "link", "link-to-file", "link-to-folder", "broken-link", "special"}, options->types);
    addValues(app, "-s,--size", "SIZE", "Only files of 100 bytes, of at least +1M (MiB), of at most -64K",
              [options = options.get()](std::string const& text) { options->sizes.push_back(parseSizeTest(text)); });
    addTimes(app, *options);
    addNumber(app, "-d,--max-depth", "N", "Go no deeper; 1 is what a folder itself holds", options->maximumDepth);
    addFlag(app, "-a,--all", options->isAll, "Also find scratch files, of writes that are not finished");
    addFlag(app, "--json", options->isJSON, "Print one JSON object a line for each");
    addFlag(app, "-0,--null", options->endsInNull, "End each path by a NUL, not by a line end");
    addOperands(app, "[PATH...]", "Folders to look through, and files; the working folder when there are none", 0,
                options->paths);
    return [options](Session& session) {
        std::transform(options->paths.begin(), options->paths.end(), options->paths.begin(), usableAsArgument);
        Finder finder(session, *options);
        session.forEachPlace(options->paths, [&](Place const& place) { finder.find(place); });
    };
}

} // namespace foundation::storage::tool
