#include <tools/storage/CopyRun.hpp>
#include <tools/storage/Session.hpp>
#include <tools/storage/TargetOperand.hpp>
#include <tools/storage/TreeCopier.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/copyOptions.hpp>
#include <tools/storage/interrupt.hpp>

#include <memory>
#include <optional>

namespace foundation::storage::tool {

namespace {

struct Options
{
    std::vector<std::string> paths;
    bool isRecursive = false;
    bool replaces = false;
    bool isUpdate = false;
    bool isInPlace = false;
    bool keepsMetadata = false;
    TransferOptions transfers;
};

CopyRunOptions runOptions(Options const& options)
{
    CopyRunOptions result;
    result.files.replace = options.replaces || options.isUpdate ? Replace::Files : Replace::Never;
    result.files.isInPlace = options.isInPlace;
    result.files.isUpdate = options.isUpdate;
    result.files.keepsMetadata = options.keepsMetadata;
    result.telling = tellingOf(options.transfers);
    result.jobs = jobsOf(options.transfers);
    return result;
}

class Copy
{
public:
    Copy(Session& session, Options const& options, Place target)
        : session_(session),
          run_(session, runOptions(options)),
          trees_(session.stores(), run_),
          target_(std::move(target), options.paths.size() - 1),
          isRecursive_(options.isRecursive)
    {}

    void copyAll(std::vector<std::string> const& sources)
    {
        if (session_.progress().isShown())
            run_.announce(placesOf(session_, sources));
        bool areAllAsked = false;
        try {
            for (std::string const& source : sources)
                copyArgument(source);
            areAllAsked = true;
            run_.finish();
        } catch (Interrupted const& interrupted) {
            throw Interrupted{interrupted.signal, run_.stop(areAllAsked)};
        }
    }

private:
    void copyArgument(std::string const& argument)
    {
        std::optional<Place> source;
        try {
            source = session_.stores().open(argument);
            copy(*source);
        } catch (Failure const& failure) {
            source ? run_.fail(*source, failure) : run_.fail(failure);
        }
    }

    void copy(Place const& source)
    {
        Kind const kind = requireCopyable(source);
        if (kind == Kind::RegularFolder && !isRecursive_)
            throw Failure{source.text(), "a folder (-r copies folders and all they hold)"};
        Place const target = target_.targetOf(source);
        if (kind == Kind::RegularFolder)
            trees_.copy(source, target);
        else
            run_.copyFile(source, target, TargetState::Unknown);
    }

    Session& session_;
    CopyRun run_;
    TreeCopier trees_;
    TargetOperand target_;
    bool isRecursive_;
};

void copyAll(Session& session, Options const& options)
{
    if (options.transfers.isSynced)
        session.stores().syncAll();
    if (options.keepsMetadata)
        session.stores().keepMetadata();
    std::vector<std::string> sources = options.paths;
    Place target = session.stores().open(sources.back());
    sources.pop_back();
    if (options.transfers.showsProgress)
        session.progress().showLines();
    Copy(session, options, std::move(target)).copyAll(sources);
}

} // namespace

Action defineCp(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addFlag(app, "-r,-R,--recursive", options->isRecursive, "Also copy folders, with all they hold");
    addFlag(app, "--replace", options->replaces, "Replace files at the target; folders are never replaced");
    addFlag(app, "-u,--update", options->isUpdate,
            "Pass over files that are up to date at the target (of the same size, and no older), and replace others");
    addFlag(app, "-p,--preserve", options->keepsMetadata,
            "Keep the times of the last change, and of local files extended attributes too");
    addFlag(app, "--in-place", options->isInPlace,
            "Write into the file at the target itself: what fails half-way leaves half of it");
    addTransferOptions(app, "Name each file that was copied", options->transfers);
    exclude(app, "--sync", "--in-place");
    exclude(app, "--preserve", "--in-place");
    addOperands(app, "SOURCE... TARGET", "What to copy, and the folder that receives it, or its new name", 2,
                options->paths);
    return [options](Session& session) { copyAll(session, *options); };
}

} // namespace foundation::storage::tool
