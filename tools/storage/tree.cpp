#include <storage/local/scratchFiles.hpp>
#include <tools/storage/Session.hpp>
#include <tools/storage/TreeCursor.hpp>
#include <tools/storage/TreeWalk.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/entries.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/kinds.hpp>
#include <tools/storage/printable.hpp>

#include <fl/filesystem/native_name.hpp>
#include <fmt/format.h>
#include <memory>
#include <vector>

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

    bool visit(TreeCursor& tree, ListedName const& listed) override
    {
        if (!isAll_ && local::isScratchName(listed.name))
            return false;
        Kind const kind = tree.kindOf(listed);
        print(describeEntry(tree.placeOf(listed), kind, listed), tree.depth() + 1);
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
        std::size_t indentation; ///< how much of the whole stands there
        std::optional<ListedName> next = {};
    };

    void begin();
    void lookAhead();
    void leave();
    void drawNext();
    void drawFile(ListedName const& entry, bool isLast);
    void drawFolder(ListedName const& entry, bool isLast);
    void drawLine(char const* stroke, std::u16string const& name, char const* remark);

    Session& session_;
    bool isAll_;
    Strokes strokes_;
    std::unique_ptr<TreeCursor> tree_;
    std::vector<Branch> branches_;
    std::string indentation_;
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
    session_.attempt([&] {
        tree_ = openTree(session_.stores(), root, Listing::NamesOnly);
        begin();
    });
    while (!branches_.empty()) {
        checkInterrupt();
        session_.attempt([&] { drawNext(); });
    }
    session_.output().write(fmt::format("\n{}, {}", counted(folders_, "folder"), counted(files_, "file")));
    session_.output().endLine();
}

void Drawing::begin()
{
    branches_.push_back({indentation_.size()});
    lookAhead();
}

void Drawing::lookAhead()
{
    branches_.back().next.reset();
    do
        branches_.back().next = tree_->next();
    while (branches_.back().next && !isAll_ && local::isScratchName(branches_.back().next->name));
}

/// Folders that were moved away meanwhile are left, too.
void Drawing::leave()
{
    branches_.pop_back();
    if (branches_.empty())
        return;
    auto const follow = [&] {
        branches_.resize(tree_->depth() + 1, Branch{});
        indentation_.resize(branches_.back().indentation);
    };
    try {
        tree_->leave();
    } catch (Failure const&) {
        follow();
        throw;
    }
    follow();
}

void Drawing::drawNext()
{
    if (!branches_.back().next)
        return leave();
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
    bool const isLink = tree_->kindOf(entry) == Kind::SymlinkToFolder;
    drawLine(isLast ? strokes_.lastBranch : strokes_.branch, entry.name,
             isLink ? " (a link to a folder, not followed)" : "");
    ++folders_;
    if (isLink || !tree_->enter(entry))
        return;
    indentation_ += isLast ? strokes_.space : strokes_.trunk;
    begin();
}

void Drawing::drawLine(char const* stroke, std::u16string const& name, char const* remark)
{
    Output& output = session_.output();
    output.write(indentation_);
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
