#include <tools/storage/FolderStack.hpp>
#include <tools/storage/Session.hpp>
#include <tools/storage/TreeWalk.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/entries.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/kinds.hpp>
#include <tools/storage/printable.hpp>
#include <tools/storage/scratchName.hpp>

#include <fl/filesystem/native_name.hpp>
#include <fmt/format.h>
#include <memory>

namespace foundation::storage::tool {

namespace {

struct Options
{
    std::vector<std::string> paths{"."};
    bool isAll = false;
    bool isASCII = false;
    bool isJSON = false;
};

/// How the lines of a tree begin.
struct Strokes
{
    char const* branch;
    char const* lastBranch;
    char const* trunk;
    char const* space;
};

constexpr Strokes unicodeStrokes{"├── ", "└── ", "│   ", "    "};
constexpr Strokes asciiStrokes{"|-- ", "`-- ", "|   ", "    "};

void requireFolder(Place const& root)
{
    if (!leadsToFolder(existingKindOf(root)))
        throw Failure{root.text(), "not a folder"};
}

/// The tree as objects, one a line.
class ObjectList : public TreeVisitor
{
public:
    ObjectList(Session& session, bool isAll) : session_(session), isAll_(isAll) {}

    void list(Place const& root)
    {
        requireFolder(root);
        print(describeEntry(root), 0);
        walkTree(session_, root, Listing::WithAttributes, *this);
    }

    bool visit(Place const& place, ListedName const& listed, std::size_t depth) override
    {
        if (!isAll_ && isScratchName(listed.name))
            return false;
        Kind const kind = kindOf(place, listed);
        print(describeEntry(place, kind, listed), depth);
        return kind == Kind::RegularFolder;
    }

private:
    void print(Entry entry, std::size_t depth)
    {
        entry.depth = depth;
        entry.isWritable.reset(); // not known of what is listed
        session_.output().write(toJSON(entry));
        session_.output().endLine();
    }

    Session& session_;
    bool isAll_;
};

class Drawing
{
public:
    Drawing(Session& session, Options const& options)
        : session_(session), isAll_(options.isAll), strokes_(options.isASCII ? asciiStrokes : unicodeStrokes)
    {}

    void draw(Place const& root);

private:
    /// One folder that is being drawn: what stands to the left of its entries, and the entry to draw next, known ahead
    /// because the last one is drawn differently.
    struct Branch
    {
        std::string indentation;
        std::optional<ListedName> next;
    };

    void enter(Place const& folder, std::string indentation);
    void lookAhead();
    void drawNext();
    void drawFile(ListedName const& entry, bool isLast);
    void drawFolder(ListedName const& entry, bool isLast);
    void drawLine(char const* stroke, std::u16string const& name, char const* remark);

    Session& session_;
    bool isAll_;
    Strokes strokes_;
    FolderStack levels_;
    std::deque<Branch> branches_;
    std::uint64_t folders_ = 0;
    std::uint64_t files_ = 0;
};

std::string counted(std::uint64_t count, char const* noun)
{
    return fmt::format("{} {}{}", count, noun, count == 1 ? "" : "s");
}

void Drawing::draw(Place const& root)
{
    requireFolder(root);
    session_.output().write(printable(root.text()));
    session_.output().endLine();
    session_.attempt([&] { enter(root, ""); });
    while (!branches_.empty()) {
        checkInterrupt();
        session_.attempt([&] { drawNext(); });
    }
    session_.output().write(fmt::format("\n{}, {}", counted(folders_, "folder"), counted(files_, "file")));
    session_.output().endLine();
}

void Drawing::enter(Place const& folder, std::string indentation)
{
    levels_.enter(folder);
    branches_.push_back({std::move(indentation), std::nullopt});
    lookAhead();
}

void Drawing::lookAhead()
{
    FolderLevel& level = levels_.innermost();
    branches_.back().next.reset();
    while (!branches_.back().next && level.hasNext()) {
        ListedName entry = level.next();
        if (isAll_ || !isScratchName(entry.name))
            branches_.back().next = std::move(entry);
    }
}

void Drawing::drawNext()
{
    if (!branches_.back().next) {
        levels_.leave();
        branches_.pop_back();
        return;
    }
    ListedName const entry = std::move(*branches_.back().next);
    session_.attempt([&] { lookAhead(); });
    bool const isLast = !branches_.back().next.has_value();
    if (entry.isFile)
        drawFile(entry, isLast);
    else
        drawFolder(entry, isLast);
}

/// Needs no location of its own: making one costs more than all the rest.
void Drawing::drawFile(ListedName const& entry, bool isLast)
{
    drawLine(isLast ? strokes_.lastBranch : strokes_.branch, entry.name, "");
    ++files_;
}

void Drawing::drawFolder(ListedName const& entry, bool isLast)
{
    Place const place = levels_.innermost().folder().child(entry.name);
    bool const isLink = kindOf(place) == Kind::SymlinkToFolder;
    drawLine(isLast ? strokes_.lastBranch : strokes_.branch, entry.name,
             isLink ? " (a link to a folder, not followed)" : "");
    ++folders_;
    if (!isLink)
        enter(place, branches_.back().indentation + (isLast ? strokes_.space : strokes_.trunk));
}

void Drawing::drawLine(char const* stroke, std::u16string const& name, char const* remark)
{
    Output& output = session_.output();
    output.write(branches_.back().indentation);
    output.write(stroke);
    output.write(printable(fl::filesystem::to_native_bytes(name)));
    output.write(remark);
    output.endLine();
}

void show(Session& session, Options const& options, Place const& root)
{
    if (options.isJSON)
        ObjectList(session, options.isAll).list(root);
    else
        Drawing(session, options).draw(root);
}

} // namespace

Action defineTree(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addFlag(app, "-a,--all", options->isAll, "Also show scratch files, of writes that are not finished");
    addFlag(app, "--ascii", options->isASCII, "Draw with ASCII characters");
    addFlag(app, "--json", options->isJSON, "Print one JSON object a line for each folder and entry instead");
    addOperands(app, "[PATH...]", "Folders to draw; the working folder when there are none", 0, options->paths);
    return [options](Session& session) {
        session.forEachPlace(options->paths, [&](Place const& place) { show(session, *options, place); });
    };
}

} // namespace foundation::storage::tool
