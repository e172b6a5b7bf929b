#include <storage/local/scratchFiles.hpp>
#include <storage/provider/Exception.hpp>
#include <tools/storage/Session.hpp>
#include <tools/storage/TreeWalk.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/entries.hpp>
#include <tools/storage/physicalPath.hpp>
#include <tools/storage/values.hpp>

#include <chrono>
#include <memory>

namespace foundation::storage::tool {

namespace {

using boost::posix_time::ptime;
using local::ScratchFileState;
using provider::ErrorCode;

struct Options
{
    std::vector<std::string> paths;
    std::chrono::seconds age = std::chrono::hours(1);
    bool isDryRun = false;
    bool isRecursive = false;
    bool isJSON = false;
};

/// Finished by its writer, or cleaned by somebody else.
constexpr ScratchFileState gone = ScratchFileState::InUse;

void requireLocalFolder(Place const& place)
{
    if (!isLocal(place))
        throw Failure{place.text(), "scratch files can be removed from local folders only"};
    if (!leadsToFolder(existingKindOf(place)))
        throw Failure{place.text(), "not a folder"};
}

class Cleaner : public TreeVisitor
{
public:
    Cleaner(Session& session, Options const& options) : session_(session), options_(options) {}

    void clean(Place const& folder)
    {
        requireLocalFolder(folder);
        walkTree(session_, folder, Listing::NamesOnly, *this);
    }

    bool visit(TreeCursor& tree, ListedName const& listed) override
    {
        Kind const kind = tree.kindOf(listed);
        if (!local::isScratchName(listed.name))
            return options_.isRecursive && kind == Kind::RegularFolder;
        Place const place = tree.workingPlaceOf(listed);
        at(place, [&] { cleanEntry(place, kind); });
        return false;
    }

private:
    void cleanEntry(Place const& place, Kind kind)
    {
        std::optional<Entry> const entry = described(place, kind);
        if (entry && stateAfterCleaning(place) == ScratchFileState::Abandoned)
            tell(place, *entry);
    }

    /// Before it is removed.
    std::optional<Entry> described(Place const& place, Kind kind) const
    {
        try {
            return options_.isJSON ? describeEntry(place) : bareEntry(place, kind);
        } catch (Failure const&) {
            if (kindOf(place) == Kind::None)
                return std::nullopt;
            throw;
        }
    }

    ScratchFileState stateAfterCleaning(Place const& place) const
    {
        provider::StorageIRI const location = place.item().getLocation();
        try {
            return options_.isDryRun ? local::examineScratchFile(location, options_.age)
                                     : local::removeAbandonedScratchFile(location, options_.age);
        } catch (provider::Exception const& error) {
            if (error.getErrorCode() != ErrorCode::ResourceNotFound)
                throw;
            return gone;
        }
    }

    void tell(Place const& place, Entry const& entry)
    {
        if (options_.isJSON)
            session_.printJSON(toJSON(entry));
        else if (options_.isDryRun)
            session_.printName(place.text());
    }

    Session& session_;
    Options const& options_;
};

void addAge(CLI::App& app, Options& options)
{
    ptime const now = boost::posix_time::microsec_clock::universal_time();
    addValues(app, "--older-than", "TIME",
              "Only what was changed before that time; 10min, 36h, 7d mean so long ago (default: 1h)",
              [&options, now](std::string const& text) {
                  options.age = std::chrono::seconds((now - parseTime(text, now)).total_seconds());
              });
}

} // namespace

Action defineClean(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addFlag(app, "-n,--dry-run", options->isDryRun, "Print what would be removed, and remove nothing");
    addFlag(app, "-r,-R,--recursive", options->isRecursive, "Also look through all folders below");
    addAge(app, *options);
    addFlag(app, "--json", options->isJSON, "Print one JSON object a line for each that is removed");
    addOperands(app, "FOLDER...", "Local folders to look through", 1, options->paths);
    return [options](Session& session) {
        Cleaner cleaner(session, *options);
        session.forEachPlace(options->paths, [&](Place const& place) { cleaner.clean(place); });
    };
}

} // namespace foundation::storage::tool
