#include <storage/local/scratchFiles.hpp>
#include <tools/storage/Session.hpp>
#include <tools/storage/TreeWalk.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/entries.hpp>
#include <tools/storage/format.hpp>
#include <tools/storage/physicalPath.hpp>

#include <algorithm>
#include <fmt/format.h>
#include <limits>
#include <memory>
#include <set>

namespace foundation::storage::tool {

namespace {

struct Options
{
    std::vector<std::string> paths{"."};
    std::optional<std::size_t> maximumDepth;
    bool isAll = false;
    bool isSummary = false;
    bool hasTotal = false;
    bool isHumanReadable = false;
    bool isJSON = false;

    bool shows(std::size_t depth) const
    {
        return depth == 0 || (!isSummary && (!maximumDepth || depth <= *maximumDepth));
    }
};

struct Sum
{
    std::uint64_t bytes = 0;
    std::uint64_t files = 0;

    Sum& operator+=(Sum const& other)
    {
        bytes += other.bytes;
        files += other.files;
        return *this;
    }
};

/// The arguments that have been summed up, by their physical paths.
class CountedPaths
{
public:
    void add(std::u16string const& path) { paths_.insert(path); }
    bool contains(std::u16string const& path) const { return paths_.contains(path); }

    /// Whether one of them is this path, or a folder that it lies in.
    bool cover(std::u16string path) const
    {
        for (;;) {
            if (contains(path))
                return true;
            std::size_t const slash = path.rfind(u'/');
            if (slash == std::u16string::npos || path == u"/")
                return false;
            path.resize(slash == 0 ? 1 : slash);
        }
    }

    /// Whether one of them lies somewhere below a folder.
    bool haveSomeBelow(std::u16string const& folder) const
    {
        std::u16string const prefix = folder.ends_with(u'/') ? folder : folder + u'/';
        auto const next = paths_.upper_bound(prefix);
        return next != paths_.end() && next->starts_with(prefix);
    }

private:
    std::set<std::u16string> paths_;
};

class Summation : public TreeVisitor
{
public:
    Summation(Session& session, Options const& options) : session_(session), options_(options) {}

    void sumUp(Place const& root);
    void printTotal();

    bool visit(TreeCursor& tree, ListedName const& listed) override;
    void enter() override { folders_.emplace_back(); }
    void leave(TreeCursor const& tree) override;
    void lose() override { add(takeInnermost()); }

private:
    bool wasCounted(TreeCursor const& tree, ListedName const& listed) const;
    Sum takeInnermost();
    void add(Sum const& sum) { (folders_.empty() ? total_ : folders_.back()) += sum; }
    void print(Place const& place, Kind kind, Sum const& sum);
    void printLine(std::string const& text, Sum const& sum);
    void printSize(Sum const& sum);

    Session& session_;
    Options const& options_;
    CountedPaths counted_;
    bool meetsCounted_ = false;
    std::vector<Sum> folders_;                                          ///< from the argument down to where the walk is
    std::size_t hiddenDepth_ = std::numeric_limits<std::size_t>::max(); ///< of the scratch folder around the walk
    Sum total_;
};

/// Of one argument alone nothing can be met twice, and nobody has to be asked for physical paths.
void Summation::sumUp(Place const& root)
{
    Kind const kind = existingKindOf(root);
    std::u16string const path = options_.paths.size() > 1 ? physicalPath(root) : u"";
    if (counted_.cover(path))
        return print(root, kind, {});
    if (leadsToFolder(kind)) {
        meetsCounted_ = counted_.haveSomeBelow(path);
        walkTree(session_, root, Listing::WithAttributes, *this);
    } else {
        Sum const sum{describeEntry(root).size.value_or(0), leadsToFile(kind) ? 1U : 0U};
        add(sum);
        print(root, kind, sum);
    }
    counted_.add(path);
}

bool Summation::wasCounted(TreeCursor const& tree, ListedName const& listed) const
{
    return meetsCounted_ && counted_.contains(physicalPath(tree.placeOf(listed)));
}

/// What a listing calls a file or a folder may be a link to one.
bool Summation::visit(TreeCursor& tree, ListedName const& listed)
{
    Kind const kind = tree.kindOf(listed);
    if ((kind != Kind::RegularFile && kind != Kind::RegularFolder) || wasCounted(tree, listed))
        return false;
    if (kind == Kind::RegularFile)
        add({listed.size ? *listed.size : describeEntry(tree.workingPlaceOf(listed)).size.value_or(0), 1});
    else if (!options_.isAll && local::isScratchName(listed.name))
        hiddenDepth_ = std::min(hiddenDepth_, tree.depth() + 1);
    return kind == Kind::RegularFolder;
}

Sum Summation::takeInnermost()
{
    Sum const sum = folders_.back();
    folders_.pop_back();
    if (folders_.size() <= hiddenDepth_)
        hiddenDepth_ = std::numeric_limits<std::size_t>::max();
    return sum;
}

void Summation::leave(TreeCursor const& tree)
{
    bool const isShown = options_.shows(tree.depth()) && tree.depth() < hiddenDepth_;
    Sum const sum = takeInnermost();
    add(sum);
    if (isShown && options_.isJSON)
        print(tree.place(), Kind::RegularFolder, sum);
    else if (isShown)
        printLine(tree.text(), sum);
}

void Summation::print(Place const& place, Kind kind, Sum const& sum)
{
    if (!options_.isJSON)
        return printLine(place.text(), sum);
    Entry entry = bareEntry(place, kind);
    entry.size = sum.bytes;
    entry.files = sum.files;
    session_.output().write(toJSON(entry));
    session_.output().endLine();
}

void Summation::printLine(std::string const& text, Sum const& sum)
{
    printSize(sum);
    session_.printName(text);
}

void Summation::printSize(Sum const& sum)
{
    session_.output().write(
        fmt::format("{:>12}  ", options_.isHumanReadable ? formatSize(sum.bytes) : fmt::to_string(sum.bytes)));
}

void Summation::printTotal()
{
    if (options_.isJSON) {
        session_.output().write(fmt::format(R"({{"type":"total","size":{},"files":{}}})", total_.bytes, total_.files));
        session_.output().endLine();
    } else {
        printLine("total", total_);
    }
}

void sumUpAll(Session& session, Options const& options)
{
    Summation summation(session, options);
    session.forEachPlace(options.paths, [&](Place const& place) { summation.sumUp(place); });
    if (options.hasTotal)
        summation.printTotal();
}

} // namespace

Action defineDu(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addFlag(app, "-a,--all", options->isAll, "Also print lines for scratch folders, of moves that are not finished");
    addFlag(app, "-s,--summarize", options->isSummary, "Print a line for each path that is given, and no others");
    addNumber(app, "-d,--max-depth", "N", "Print lines for folders down to this depth; all count",
              options->maximumDepth);
    addFlag(app, "-c,--total", options->hasTotal, "Print a total at the end");
    addHumanReadable(app, options->isHumanReadable, "Print sizes as 1.5 KiB, 23 MiB; otherwise in bytes");
    addFlag(app, "--json", options->isJSON, "Print one JSON object a line");
    addOperands(app, "[PATH...]", "Folders and files to sum up; the working folder when there are none", 0,
                options->paths);
    return [options](Session& session) { sumUpAll(session, *options); };
}

} // namespace foundation::storage::tool
